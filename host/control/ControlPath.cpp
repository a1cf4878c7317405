// SPDX-License-Identifier: Apache-2.0
#include "host/control/ControlPath.h"

#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <filesystem>
#include <system_error>

namespace {

namespace fs = std::filesystem;

constexpr const char* kExtension = ".sock";
constexpr mode_t kOwnerOnly = S_IRWXU;
constexpr mode_t kOthers = S_IRWXG | S_IRWXO;

std::string FromEnvironment(const char* name) {
  const char* const value = std::getenv(name);
  return value == nullptr ? "" : value;
}

}  // namespace

std::string ControlFolder() {
  std::string own = FromEnvironment("LOKA_RUNTIME_DIR");
  if (!own.empty()) {
    return own;
  }
  const std::string session = FromEnvironment("XDG_RUNTIME_DIR");
  return session.empty() ? "/tmp/loka-" + std::to_string(getuid()) : session + "/loka";
}

std::string ControlPath(const std::string& instanceName) {
  return ControlFolder() + "/" + instanceName + kExtension;
}

std::vector<std::string> ControlNames() {
  std::vector<std::string> names;
  std::error_code error;
  for (fs::directory_iterator entry(ControlFolder(), error), end; !error && entry != end;
       entry.increment(error)) {
    if (entry->path().extension() == kExtension) {
      names.push_back(entry->path().stem());
    }
  }
  std::sort(names.begin(), names.end());
  return names;
}

bool MakeControlFolder(std::string* error) {
  const std::string folder = ControlFolder();
  if (mkdir(folder.c_str(), kOwnerOnly) != 0 && errno != EEXIST) {
    *error = folder + ": " + std::generic_category().message(errno);
    return false;
  }
  struct stat status {};
  // Not through a link that somebody else has put there.
  if (lstat(folder.c_str(), &status) != 0 || !S_ISDIR(status.st_mode) ||
      status.st_uid != geteuid() || (status.st_mode & kOthers) != 0) {
    *error = folder + " must be a folder of this user that nobody else can enter (mode 0700)";
    return false;
  }
  return true;
}
