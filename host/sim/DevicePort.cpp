// SPDX-License-Identifier: Apache-2.0
#include "host/sim/DevicePort.h"

#include <fcntl.h>
#include <poll.h>
#include <sys/ioctl.h>
#include <termios.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <cstdlib>
#include <system_error>

#include "host/base/Deadline.h"
#include "host/port/LineSettings.h"

namespace {

constexpr std::size_t kChunkBytes = 4096;
constexpr std::size_t kPathBytes = 64;
constexpr int kOutDrainStepMs = 5;
constexpr int kUnseenDrainMs = 1000;
constexpr int kHostEndFlags = O_RDWR | O_NOCTTY | O_CLOEXEC | O_NONBLOCK;

[[noreturn]] void Throw(const char* operation) {
  throw std::system_error(errno, std::generic_category(), operation);
}

}  // namespace

DevicePort::~DevicePort() { Unplug(); }

void DevicePort::Plug() {
  Unplug();
  deviceEnd_ = posix_openpt(O_RDWR | O_NOCTTY | O_CLOEXEC);
  std::array<char, kPathBytes> path{};
  if (deviceEnd_ < 0 || grantpt(deviceEnd_) != 0 || unlockpt(deviceEnd_) != 0 ||
      ptsname_r(deviceEnd_, path.data(), path.size()) != 0 ||
      fcntl(deviceEnd_, F_SETFL, O_NONBLOCK) != 0) {
    Throw("pseudo-terminal");
  }
  path_ = path.data();
  // The mode stays when the host's end is closed; its first close also makes "closed" visible.
  const int hostEnd = open(path_.c_str(), kHostEndFlags);
  termios line{};
  if (hostEnd < 0 || tcgetattr(hostEnd, &line) != 0) {
    Throw("pseudo-terminal");
  }
  BuildRawMode(&line);
  (void)tcsetattr(hostEnd, TCSANOW, &line);
  (void)close(hostEnd);
}

void DevicePort::Unplug() {
  if (deviceEnd_ >= 0) {
    (void)close(deviceEnd_);
    deviceEnd_ = -1;
    path_.clear();
  }
}

bool DevicePort::IsOpen() const {
  pollfd wait = {deviceEnd_, 0, 0};
  return deviceEnd_ >= 0 && poll(&wait, 1, 0) >= 0 && (wait.revents & POLLHUP) == 0;
}

std::string DevicePort::Read() const {
  std::string bytes;
  std::array<char, kChunkBytes> chunk{};
  // One chunk a call: a host that never stops writing must not keep the device from its work.
  const ssize_t count = deviceEnd_ < 0 ? 0 : read(deviceEnd_, chunk.data(), chunk.size());
  if (count > 0) {
    bytes.assign(chunk.data(), static_cast<std::size_t>(count));
  }
  return bytes;
}

std::size_t DevicePort::Write(std::string_view bytes) const {
  std::size_t written = 0;
  while (written < bytes.size() && IsOpen()) {
    const ssize_t count = write(deviceEnd_, bytes.data() + written, bytes.size() - written);
    if (count > 0) {
      written += static_cast<std::size_t>(count);
    } else if (count == 0 || errno != EINTR) {
      break;
    }
  }
  return written;
}

bool DevicePort::Flush() const {
  const int hostEnd = IsPlugged() ? open(path_.c_str(), kHostEndFlags) : -1;
  if (hostEnd < 0) {
    return !IsPlugged() || errno != EBUSY || IsOpen();
  }
  (void)tcflush(hostEnd, TCIFLUSH);
  (void)close(hostEnd);
  return true;
}

std::optional<int> DevicePort::UnreadBytes() const {
  const int hostEnd = open(path_.c_str(), kHostEndFlags);
  if (hostEnd < 0) {
    return std::nullopt;
  }
  // What is still on its way inside the kernel counts too; poll(2) waits for that.
  pollfd arrival = {hostEnd, POLLIN, 0};
  (void)poll(&arrival, 1, 0);
  int count = 0;
  const bool isKnown = ioctl(hostEnd, FIONREAD, &count) == 0;
  (void)close(hostEnd);
  return isKnown ? std::optional(count) : std::nullopt;
}

void DevicePort::Drain(const Deadline& deadline) const {
  const Deadline unseen = Deadline::After(kUnseenDrainMs);
  while (IsOpen() && !deadline.HasPassed()) {
    const std::optional<int> unread = UnreadBytes();
    if (unread ? *unread == 0 : unseen.HasPassed()) {
      return;
    }
    Deadline::After(kOutDrainStepMs).Sleep();
  }
}
