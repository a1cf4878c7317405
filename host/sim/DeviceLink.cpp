// SPDX-License-Identifier: Apache-2.0
#include "host/sim/DeviceLink.h"

#include <unistd.h>

#include <filesystem>
#include <stdexcept>
#include <system_error>

namespace fs = std::filesystem;

DeviceLink::~DeviceLink() { Remove(); }

void DeviceLink::PointTo(const std::string& target) {
  if (path_.empty()) {
    return;
  }
  std::error_code error;
  const fs::file_status status = fs::symlink_status(path_, error);
  if (fs::exists(status) && !fs::is_symlink(status)) {
    throw std::runtime_error(path_ + ": is no symbolic link and stays as it is");
  }
  const std::string temporary = path_ + "." + std::to_string(getpid());
  fs::create_symlink(target, temporary, error);
  if (!error) {
    fs::rename(temporary, path_, error);
  }
  if (error) {
    std::error_code ignored;
    fs::remove(temporary, ignored);
    throw std::runtime_error(path_ + ": " + error.message());
  }
  target_ = target;
}

void DeviceLink::Remove() {
  std::error_code error;
  if (!target_.empty() && fs::read_symlink(path_, error) == target_ && !error) {
    fs::remove(path_, error);
  }
  target_.clear();
}
