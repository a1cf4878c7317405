// SPDX-License-Identifier: Apache-2.0
#include "host/demo/DemoDevice.h"

#include <poll.h>
#include <unistd.h>

#include <array>
#include <cstdio>
#include <stdexcept>

#include "host/base/Deadline.h"
#include "host/base/ExitStatus.h"
#include "host/demo/DemoLimit.h"
#include "host/port/PseudoTerminal.h"
#include "host/text/ByteText.h"

namespace {

constexpr std::size_t kChunkBytes = 1024;

void PrintLine(const std::string& line) {
  (void)std::printf("%s\n", line.c_str());
  (void)std::fflush(stdout);
}

void ReportSeen(const PseudoTerminal& line) {
  std::string bytes;
  (void)line.Receive(1, Deadline::After(0), &bytes);
  for (const char byte : bytes) {
    PrintLine("saw " + HexBytes(std::string(1, byte)));
  }
}

void Obey(const PseudoTerminal& line, const std::string& command) {
  constexpr const char* kSend = "send ";
  std::string bytes;
  if (command.rfind(kSend, 0) == 0 && ParseHexBytes(command.substr(5), &bytes) &&
      line.Send(bytes, Deadline::After(kDemoLimitMs))) {
    PrintLine("sent " + HexBytes(bytes));
  } else {
    PrintLine("failed " + command);
  }
}

// Takes what stands on stdin and obeys the lines that are complete. False at its end.
bool ObeyInput(const PseudoTerminal& line, std::string* pending) {
  std::array<char, kChunkBytes> chunk{};
  const ssize_t count = read(STDIN_FILENO, chunk.data(), chunk.size());
  if (count <= 0) {
    return false;
  }
  pending->append(chunk.data(), static_cast<std::size_t>(count));
  for (std::size_t end = pending->find('\n'); end != std::string::npos; end = pending->find('\n')) {
    Obey(line, pending->substr(0, end));
    pending->erase(0, end + 1);
  }
  return true;
}

}  // namespace

DemoDevice::DemoDevice() : process_("/proc/self/exe", {"loka", "demo-device"}) {
  std::string kind;
  if (!ReadReport(Deadline::After(kDemoLimitMs), &kind, &portPath_) || kind != "port") {
    throw std::runtime_error("the simulated device does not start");
  }
}

bool DemoDevice::ReadReport(const Deadline& deadline, std::string* kind, std::string* value) {
  std::string line;
  if (!process_.ReadLine(deadline, &line)) {
    return false;
  }
  const std::size_t blank = line.find(' ');
  *kind = line.substr(0, blank);
  *value = blank == std::string::npos ? "" : line.substr(blank + 1);
  return true;
}

bool DemoDevice::Send(const std::string& bytes) {
  if (!process_.WriteLine("send " + HexBytes(bytes))) {
    return false;
  }
  const Deadline deadline = Deadline::After(kDemoLimitMs);
  std::string kind;
  std::string value;
  while (ReadReport(deadline, &kind, &value)) {
    if (kind == "saw") {
      std::string seen;
      (void)ParseHexBytes(value, &seen);
      seen_ += seen;
    } else {
      return kind == "sent";
    }
  }
  return false;
}

std::string DemoDevice::TakeSeen(std::size_t count, const Deadline& deadline) {
  std::string kind;
  std::string value;
  while (seen_.size() < count && ReadReport(deadline, &kind, &value)) {
    std::string seen;
    if (kind == "saw" && ParseHexBytes(value, &seen)) {
      seen_ += seen;
    }
  }
  std::string result;
  result.swap(seen_);
  return result;
}

int RunDemoDevice() {
  const PseudoTerminal line;
  PrintLine("port " + line.Path());
  std::string pending;
  for (;;) {
    std::array<pollfd, 2> waits = {{{STDIN_FILENO, POLLIN, 0}, {line.FileDescriptor(), POLLIN, 0}}};
    if (Deadline::After(kDemoLimitMs).Poll(waits.data(), waits.size()) < 0) {
      return static_cast<int>(ExitStatus::kRefused);
    }
    if (waits[1].revents != 0) {
      ReportSeen(line);
    }
    if (waits[0].revents != 0 && !ObeyInput(line, &pending)) {
      return static_cast<int>(ExitStatus::kDone);
    }
  }
}
