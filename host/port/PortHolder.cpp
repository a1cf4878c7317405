// SPDX-License-Identifier: Apache-2.0
#include "host/port/PortHolder.h"

#include <sys/stat.h>
#include <sys/sysmacros.h>
#include <unistd.h>

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <sstream>

#include "host/text/ByteText.h"

namespace fs = std::filesystem;

namespace {

// Calls visit(pid, folder) for every process until it returns false.
template <typename Visitor>
void ForEachProcess(Visitor visit) {
  std::error_code error;
  for (fs::directory_iterator entry("/proc", error), end; !error && entry != end;
       entry.increment(error)) {
    const int processId =
        static_cast<int>(std::strtol(entry->path().filename().c_str(), nullptr, 10));
    if (processId > 0) {
      visit(processId, entry->path());
    }
  }
}

// The command line with its arguments, shortened; the kernel's short name where there is none.
std::string CommandOf(int processId) {
  constexpr std::size_t kMostCharacters = 60;
  const std::string folder = "/proc/" + std::to_string(processId);
  std::ifstream lineFile(folder + "/cmdline", std::ios::binary);
  std::string command{std::istreambuf_iterator<char>(lineFile), std::istreambuf_iterator<char>()};
  while (!command.empty() && command.back() == '\0') {
    command.pop_back();
  }
  std::replace(command.begin(), command.end(), '\0', ' ');
  if (command.empty()) {
    std::ifstream nameFile(folder + "/comm");
    std::getline(nameFile, command);
  }
  if (command.size() > kMostCharacters) {
    command = command.substr(0, kMostCharacters) + "...";
  }
  return command.empty() ? "?" : EscapeBytes(command);
}

// Two nodes name the same device. Numbers of pseudo-terminals count within their own mount only.
bool IsSameDevice(const struct stat& a, const struct stat& b) {
  constexpr unsigned int kFirstPtyMajor = 136;
  constexpr unsigned int kLastPtyMajor = 143;
  const unsigned int number = major(a.st_rdev);
  const bool isPty = number >= kFirstPtyMajor && number <= kLastPtyMajor;
  return S_ISCHR(b.st_mode) && a.st_rdev == b.st_rdev && (!isPty || a.st_dev == b.st_dev);
}

bool HasOpen(const fs::path& process, const struct stat& device) {
  std::error_code error;
  for (fs::directory_iterator entry(process / "fd", error), end; !error && entry != end;
       entry.increment(error)) {
    struct stat opened {};
    if (stat(entry->path().c_str(), &opened) == 0 && IsSameDevice(device, opened)) {
      return true;
    }
  }
  return false;
}

// "00:1a:3", the way in which /proc/locks names a file: device numbers in hexadecimal, then inode.
std::string LockName(const struct stat& file) {
  std::ostringstream name;
  name << std::hex;
  for (const unsigned int part : {major(file.st_dev), minor(file.st_dev)}) {
    name << (part < 0x10 ? "0" : "") << part << ":";
  }
  name << std::dec << file.st_ino;
  return name.str();
}

std::vector<PortHolder> FindLockOwners(const struct stat& file) {
  std::vector<PortHolder> owners;
  const std::string wanted = LockName(file);
  std::ifstream locks("/proc/locks");
  for (std::string line; std::getline(locks, line);) {
    std::istringstream fields(line);
    std::string number;
    std::string kind;
    std::string manner;
    std::string access;
    std::string name;
    int processId = 0;
    fields >> number >> kind >> manner >> access >> processId >> name;
    if (kind == "FLOCK" && name == wanted && processId > 0) {
      owners.push_back({processId, CommandOf(processId)});
    }
  }
  return owners;
}

}  // namespace

std::vector<PortHolder> FindPortHolders(const std::string& path) {
  struct stat device {};
  if (stat(path.c_str(), &device) != 0) {
    return {};
  }
  std::vector<PortHolder> holders = FindLockOwners(device);
  if (holders.empty()) {
    ForEachProcess([&](int processId, const fs::path& process) {
      if (HasOpen(process, device)) {
        holders.push_back({processId, CommandOf(processId)});
      }
    });
  }
  return holders;
}

bool IsControllingTerminal(const std::string& path) {
  struct stat device {};
  if (stat(path.c_str(), &device) != 0) {
    return false;
  }
  // The number in /proc is the kernel's 32-bit form: minor bits 0 to 7 and 20 to 31, major between.
  const unsigned int low = minor(device.st_rdev) & 0xFFU;
  const unsigned int high = (minor(device.st_rdev) & ~0xFFU) << 12U;
  const auto wanted = static_cast<int>(low | (major(device.st_rdev) << 8U) | high);
  bool found = false;
  ForEachProcess([&](int, const fs::path& process) {
    std::ifstream file(process / "stat");
    std::string line;
    std::getline(file, line);
    // The command stands in parentheses and may itself hold blanks and parentheses.
    const std::size_t end = line.rfind(')');
    if (end == std::string::npos) {
      return;
    }
    std::istringstream fields(line.substr(end + 1));
    char state = 0;
    int parent = 0;
    int group = 0;
    int session = 0;
    int terminal = 0;
    fields >> state >> parent >> group >> session >> terminal;
    found = found || terminal == wanted;
  });
  return found;
}
