// SPDX-License-Identifier: Apache-2.0
#include "host/port/PortAdvice.h"

#include <grp.h>
#include <sys/stat.h>

#include <array>

#include "host/port/PortList.h"

namespace {

// The group whose members may use the device; the one that owns serial ports by custom when the
// device itself does not tell.
std::string GroupOf(const std::string& path) {
  constexpr const char* kCustomaryGroup = "dialout";
  struct stat device {};
  if (stat(path.c_str(), &device) != 0 || (device.st_mode & (S_IRGRP | S_IWGRP)) == 0 ||
      device.st_gid == 0) {
    return kCustomaryGroup;
  }
  constexpr std::size_t kBufferBytes = 4096;
  std::array<char, kBufferBytes> buffer{};
  group entry{};
  group* found = nullptr;
  if (getgrgid_r(device.st_gid, &entry, buffer.data(), buffer.size(), &found) != 0 ||
      found == nullptr) {
    return kCustomaryGroup;
  }
  return found->gr_name;
}

void AdviseRights(const PortProblem& problem, std::vector<std::string>* lines) {
  const std::string group = GroupOf(problem.path);
  lines->push_back("members of the group " + group + " may use it; to join:");
  lines->push_back("  sudo usermod -aG " + group + " \"$USER\"    then log in again");
}

void AdviseBusy(const PortProblem& problem, std::vector<std::string>* lines) {
  for (const PortHolder& holder : problem.holders) {
    lines->push_back("held by process " + std::to_string(holder.processId) + " (" + holder.command +
                     "); end it or choose another port");
  }
  if (problem.holders.empty()) {
    lines->push_back("the process that holds it belongs to another user; to see it:");
    lines->push_back("  sudo fuser -v " + problem.path);
  }
}

void AdviseAbsent(std::vector<std::string>* lines) {
  const std::vector<ListedPort> ports = ListPorts();
  if (ports.empty()) {
    lines->push_back("this machine has no serial port now; is the adapter plugged in?");
  } else {
    lines->push_back("ports that are there:");
    for (const ListedPort& port : ports) {
      lines->push_back("  " + port.path + (port.alias.empty() ? "" : "  (" + port.alias + ")"));
    }
  }
  lines->push_back("a pseudo-terminal (/dev/pts/N) is there only while its other end is open");
}

}  // namespace

std::vector<std::string> AdviceFor(const PortProblem& problem) {
  std::vector<std::string> lines;
  const std::string subject = problem.path.empty() ? problem.portName : problem.path;
  lines.push_back(subject + ": " + problem.text);
  switch (problem.kind) {
    case PortProblem::Kind::kNoRights:
      AdviseRights(problem, &lines);
      break;
    case PortProblem::Kind::kBusy:
      AdviseBusy(problem, &lines);
      break;
    case PortProblem::Kind::kAbsent:
      AdviseAbsent(&lines);
      break;
    case PortProblem::Kind::kNotMapped:
      lines.push_back("say which port it is: --port " + problem.portName + "=/dev/ttyUSB0");
      break;
    default:
      break;
  }
  return lines;
}
