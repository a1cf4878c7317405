// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <fcntl.h>
#include <sched.h>
#include <sys/mount.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <fstream>
#include <string>
#include <system_error>

// A file system of 256 KiB in a folder, seen by this process and its children alone. Needs root or
// the right to make user namespaces; where there is neither, WhyNot says so.
class SmallFileSystem {
 public:
  static constexpr int kSizeBytes = 256 * 1024;

  explicit SmallFileSystem(const std::string& folder) : folder_(folder) {
    const uid_t user = getuid();
    const gid_t group = getgid();
    const bool isOurs = unshare(geteuid() == 0 ? CLONE_NEWNS : CLONE_NEWUSER | CLONE_NEWNS) == 0;
    if (isOurs && geteuid() != 0) {
      Write("/proc/self/setgroups", "deny");
      Write("/proc/self/uid_map", "0 " + std::to_string(user) + " 1");
      Write("/proc/self/gid_map", "0 " + std::to_string(group) + " 1");
    }
    (void)mkdir(folder_.c_str(), S_IRWXU);
    const std::string options = "mode=0700,size=" + std::to_string(kSizeBytes);
    if (!isOurs || mount("none", "/", nullptr, MS_REC | MS_PRIVATE, nullptr) != 0 ||
        mount("tmpfs", folder_.c_str(), "tmpfs", 0, options.c_str()) != 0) {
      whyNot_ = "no file system of its own: " + std::generic_category().message(errno);
    }
  }
  ~SmallFileSystem() {
    if (whyNot_.empty()) {
      (void)umount2(folder_.c_str(), MNT_DETACH);
    }
  }
  SmallFileSystem(const SmallFileSystem&) = delete;
  SmallFileSystem& operator=(const SmallFileSystem&) = delete;

  // Empty when it is there.
  const std::string& WhyNot() const { return whyNot_; }

  // Takes all the room that is left, or gives it back.
  void Fill() const {
    const int file = open(FillFile().c_str(), O_WRONLY | O_CREAT | O_APPEND | O_CLOEXEC, 0600);
    const std::string block(512, 'x');
    while (write(file, block.data(), block.size()) > 0) {
    }
    (void)close(file);
  }
  void Empty() const { (void)unlink(FillFile().c_str()); }

  // False when somebody has a file open for writing there.
  bool MakeReadOnly() const {
    return mount("none", folder_.c_str(), nullptr, MS_REMOUNT | MS_RDONLY, nullptr) == 0;
  }

 private:
  std::string FillFile() const { return folder_ + "/fill"; }
  static void Write(const std::string& path, const std::string& text) {
    std::ofstream(path) << text;
  }

  const std::string folder_;
  std::string whyNot_;
};
