// SPDX-License-Identifier: Apache-2.0
#include "host/port/PseudoTerminal.h"

#include <fcntl.h>
#include <poll.h>
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

[[noreturn]] void Throw(const char* operation) {
  throw std::system_error(errno, std::generic_category(), operation);
}

std::string HostEndPath(int deviceEnd) {
  constexpr std::size_t kPathBytes = 64;
  std::array<char, kPathBytes> path{};
  if (grantpt(deviceEnd) != 0 || unlockpt(deviceEnd) != 0 ||
      ptsname_r(deviceEnd, path.data(), path.size()) != 0) {
    Throw("unlockpt");
  }
  return path.data();
}

bool WaitFor(int descriptor, short events, const Deadline& deadline) {
  pollfd wait = {descriptor, events, 0};
  return deadline.Poll(&wait, 1) > 0;
}

}  // namespace

PseudoTerminal::PseudoTerminal() : deviceEnd_(posix_openpt(O_RDWR | O_NOCTTY | O_CLOEXEC)) {
  if (deviceEnd_ < 0) {
    Throw("posix_openpt");
  }
  path_ = HostEndPath(deviceEnd_);
  hostEnd_ = open(path_.c_str(), O_RDWR | O_NOCTTY | O_CLOEXEC);
  termios line{};
  if (hostEnd_ < 0 || fcntl(deviceEnd_, F_SETFL, O_NONBLOCK) != 0 ||
      tcgetattr(hostEnd_, &line) != 0) {
    Throw("pseudo-terminal");
  }
  BuildRawMode(&line);
  (void)tcsetattr(hostEnd_, TCSANOW, &line);
}

PseudoTerminal::~PseudoTerminal() {
  (void)close(hostEnd_);
  (void)close(deviceEnd_);
}

bool PseudoTerminal::Send(std::string_view bytes, const Deadline& deadline) const {
  while (!bytes.empty()) {
    const ssize_t count = write(deviceEnd_, bytes.data(), bytes.size());
    if (count > 0) {
      bytes.remove_prefix(static_cast<std::size_t>(count));
    } else if (count == 0 || errno == EAGAIN) {
      if (deadline.HasPassed() || !WaitFor(deviceEnd_, POLLOUT, deadline)) {
        return false;
      }
    } else if (errno != EINTR) {
      return false;
    }
  }
  return true;
}

bool PseudoTerminal::Receive(std::size_t count, const Deadline& deadline,
                             std::string* bytes) const {
  std::array<char, kChunkBytes> chunk{};
  while (bytes->size() < count) {
    const ssize_t got = read(deviceEnd_, chunk.data(), chunk.size());
    if (got > 0) {
      bytes->append(chunk.data(), static_cast<std::size_t>(got));
    } else if (got < 0 && errno == EAGAIN) {
      if (!WaitFor(deviceEnd_, POLLIN, deadline)) {
        return false;
      }
    } else if (got == 0 || errno != EINTR) {
      return false;
    }
  }
  return true;
}
