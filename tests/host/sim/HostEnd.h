// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <fcntl.h>
#include <poll.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <string>

#include "host/base/Deadline.h"

// The host's end of a simulated device's port, opened like any program would.
class HostEnd {
 public:
  explicit HostEnd(const std::string& path)
      : descriptor_(open(path.c_str(), O_RDWR | O_NOCTTY | O_NONBLOCK | O_CLOEXEC)) {}
  ~HostEnd() { Close(); }
  HostEnd(const HostEnd&) = delete;
  HostEnd& operator=(const HostEnd&) = delete;

  bool IsOpen() const { return descriptor_ >= 0; }

  void Close() {
    if (descriptor_ >= 0) {
      (void)close(descriptor_);
      descriptor_ = -1;
    }
  }

  // Keeps others out; stays in effect when the port is closed like this.
  bool Lock() const { return ioctl(descriptor_, TIOCEXCL) == 0; }

  bool Write(const std::string& bytes) const {
    return write(descriptor_, bytes.data(), bytes.size()) == static_cast<ssize_t>(bytes.size());
  }

  // What comes until there are `count` bytes, the device has gone or the time is over.
  std::string Read(std::size_t count, int timeoutMs) const {
    const Deadline deadline = Deadline::After(timeoutMs);
    std::string bytes;
    while (bytes.size() < count) {
      pollfd wait = {descriptor_, POLLIN, 0};
      std::array<char, 4096> chunk{};
      if (deadline.Poll(&wait, 1) <= 0) {
        break;
      }
      const ssize_t got = read(descriptor_, chunk.data(), chunk.size());
      if (got > 0) {
        bytes.append(chunk.data(), static_cast<std::size_t>(got));
      } else if (got == 0 || errno != EAGAIN) {
        break;
      }
    }
    return bytes;
  }

 private:
  int descriptor_;
};
