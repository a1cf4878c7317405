// SPDX-License-Identifier: Apache-2.0
#include "tests/panel/emulated/EmulatedPanel.h"

#include <fcntl.h>
#include <poll.h>
#include <signal.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <chrono>
#include <cstdlib>
#include <cstring>
#include <stdexcept>
#include <thread>
#include <vector>

namespace {

constexpr int kStartLimitMs = 120000;
constexpr const char* kReady = "panel: ready ";
constexpr const char* kStatus = "panel: status ";

long long NowMs() {
  return std::chrono::duration_cast<std::chrono::milliseconds>(
             std::chrono::steady_clock::now().time_since_epoch())
      .count();
}

bool StartsWith(const std::string& text, const std::string& start) {
  return text.compare(0, start.size(), start) == 0;
}

// Adds what can be read within the time; false when the time is over or the other end has closed.
bool ReadMore(int file, long long deadlineMs, std::string& pending) {
  pollfd wait = {file, POLLIN, 0};
  const long long left = std::max(0LL, deadlineMs - NowMs());
  if (poll(&wait, 1, static_cast<int>(left)) <= 0) return false;
  std::array<char, 4096> bytes;
  const ssize_t count = read(file, bytes.data(), bytes.size());
  if (count <= 0) return false;
  pending.append(bytes.data(), static_cast<std::size_t>(count));
  return true;
}

void WriteAll(int file, const std::string& bytes) {
  for (std::size_t done = 0; done < bytes.size();) {
    const ssize_t count = write(file, bytes.data() + done, bytes.size() - done);
    if (count <= 0) throw std::runtime_error("the emulator does not read any more");
    done += static_cast<std::size_t>(count);
  }
}

[[noreturn]] void Execute(const std::vector<std::string>& words, int input, int output) {
  dup2(input, STDIN_FILENO);
  dup2(output, STDOUT_FILENO);
  std::vector<char*> arguments;
  for (const std::string& word : words) arguments.push_back(const_cast<char*>(word.c_str()));
  arguments.push_back(nullptr);
  execvp(arguments[0], arguments.data());
  _exit(127);
}

}  // namespace

EmulatedPanel::EmulatedPanel(const std::string& imageFolder, const std::string& diskImage) {
  std::string pattern = "/tmp/emulated-panel-XXXXXX";
  if (mkdtemp(pattern.data()) == nullptr) throw std::runtime_error("no temporary folder");
  folder_ = pattern;
  const long long begun = NowMs();
  StartEmulator(imageFolder, diskImage);
  ConnectLine();
  std::string said;
  for (;;) {
    const std::string line = ConsoleLine(begun + kStartLimitMs);
    if (StartsWith(line, kReady)) break;
    said += line + "\n";
    if (said.find("panel: no disk") != std::string::npos) throw std::runtime_error(said);
  }
  startMs_ = NowMs() - begun;
}

EmulatedPanel::~EmulatedPanel() {
  CutPower();
  unlink((folder_ + "/line").c_str());
  rmdir(folder_.c_str());
}

void EmulatedPanel::StartEmulator(const std::string& imageFolder, const std::string& diskImage) {
  int toPanel[2];
  int fromPanel[2];
  if (pipe2(toPanel, O_CLOEXEC) != 0 || pipe2(fromPanel, O_CLOEXEC) != 0) {
    throw std::runtime_error("no pipe");
  }
  const std::vector<std::string> words = {
      "qemu-system-arm", "-M", "virt,highmem=off", "-cpu", "cortex-a15", "-m", "256",
      // No device but these, and none that the machine would bring by itself.
      "-nodefaults", "-no-user-config", "-display", "none", "-nic", "none", "-no-reboot", "-kernel",
      imageFolder + "/vmlinuz", "-initrd", imageFolder + "/initramfs.gz", "-append",
      "console=ttyAMA0 quiet panic=-1", "-serial", "stdio",
      // The 16550A, its line a socket.
      "-chardev", "socket,id=line,server=on,wait=off,path=" + folder_ + "/line", "-device",
      "pci-serial,chardev=line", "-drive", "if=none,id=disk,format=raw,file=" + diskImage,
      "-device", "virtio-blk-pci,drive=disk"};
  emulator_ = fork();
  if (emulator_ == 0) Execute(words, toPanel[0], fromPanel[1]);
  close(toPanel[0]);
  close(fromPanel[1]);
  consoleIn_ = toPanel[1];
  consoleOut_ = fromPanel[0];
}

void EmulatedPanel::ConnectLine() {
  sockaddr_un address = {};
  address.sun_family = AF_UNIX;
  const std::string path = folder_ + "/line";
  std::copy(path.begin(), path.end(), address.sun_path);
  line_ = socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
  const long long deadlineMs = NowMs() + kStartLimitMs;
  while (connect(line_, reinterpret_cast<const sockaddr*>(&address), sizeof(address)) != 0) {
    if (NowMs() > deadlineMs || waitpid(emulator_, nullptr, WNOHANG) != 0) {
      throw std::runtime_error("the emulator does not start");
    }
    std::this_thread::sleep_for(std::chrono::milliseconds(20));
  }
}

void EmulatedPanel::CutPower() {
  if (emulator_ > 0) {
    kill(emulator_, SIGKILL);
    waitpid(emulator_, nullptr, 0);
    emulator_ = -1;
  }
  for (int* file : {&consoleIn_, &consoleOut_, &line_}) {
    if (*file >= 0) close(*file);
    *file = -1;
  }
}

std::string EmulatedPanel::ConsoleLine(long long deadlineMs) {
  for (;;) {
    const std::size_t end = consolePending_.find('\n');
    if (end != std::string::npos) {
      std::string line = consolePending_.substr(0, end);
      consolePending_.erase(0, end + 1);
      line.erase(std::remove(line.begin(), line.end(), '\r'), line.end());
      return line;
    }
    if (!ReadMore(consoleOut_, deadlineMs, consolePending_)) {
      throw std::runtime_error("the panel's console is silent; last: " + consolePending_);
    }
  }
}

EmulatedPanel::Reply EmulatedPanel::Run(const std::string& command, int timeoutMs) {
  WriteAll(consoleIn_, command + "\n");
  const long long deadlineMs = NowMs() + timeoutMs;
  Reply reply;
  for (;;) {
    const std::string line = ConsoleLine(deadlineMs);
    if (StartsWith(line, kStatus)) {
      reply.status = std::atoi(line.c_str() + std::strlen(kStatus));
      while (!reply.output.empty() && reply.output.back() == '\n') reply.output.pop_back();
      return reply;
    }
    reply.output += line + "\n";
  }
}

void EmulatedPanel::SendOnLine(const std::string& bytes) { WriteAll(line_, bytes); }

void EmulatedPanel::SendAtRate(const std::string& bytes, int bitsPerSecond) {
  constexpr int kBitsPerByte = 10;
  const auto begun = std::chrono::steady_clock::now();
  constexpr std::size_t kPieceBytes = 60;  // whole tokens of the stream tests
  for (std::size_t done = 0; done < bytes.size(); done += kPieceBytes) {
    const auto due = std::chrono::microseconds(1000000LL * kBitsPerByte *
                                               static_cast<long long>(done) / bitsPerSecond);
    std::this_thread::sleep_until(begun + due);
    WriteAll(line_, bytes.substr(done, kPieceBytes));
  }
}

std::string EmulatedPanel::TakeFromLine(std::size_t count, int timeoutMs) {
  const long long deadlineMs = NowMs() + timeoutMs;
  while (linePending_.size() < count && ReadMore(line_, deadlineMs, linePending_)) {
  }
  std::string taken;
  taken.swap(linePending_);
  return taken;
}
