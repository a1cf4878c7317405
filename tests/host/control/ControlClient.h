// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <cstring>
#include <nlohmann/json.hpp>
#include <stdexcept>
#include <string>

#include "host/base/Deadline.h"

// A client of a control socket that may send anything. One thread.
class ControlClient {
 public:
  static constexpr int kLimitMs = 20000;

  explicit ControlClient(const std::string& path)
      : descriptor_(socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0)) {
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    std::memcpy(address.sun_path, path.c_str(), path.size() + 1);
    if (connect(descriptor_, reinterpret_cast<const sockaddr*>(&address), sizeof address) != 0) {
      throw std::runtime_error("nobody listens at " + path);
    }
  }
  ~ControlClient() { (void)close(descriptor_); }
  ControlClient(const ControlClient&) = delete;
  ControlClient& operator=(const ControlClient&) = delete;

  // False when the server has hung up.
  bool Send(const std::string& bytes) const {
    std::size_t sent = 0;
    while (sent < bytes.size()) {
      const ssize_t count =
          send(descriptor_, bytes.data() + sent, bytes.size() - sent, MSG_NOSIGNAL);
      if (count <= 0) {
        return false;
      }
      sent += static_cast<std::size_t>(count);
    }
    return true;
  }

  // Sends as long as the server takes bytes at once; returns how many it took.
  std::size_t SendWithoutWaiting(const std::string& bytes) const {
    std::size_t sent = 0;
    while (sent < bytes.size()) {
      const ssize_t count =
          send(descriptor_, bytes.data() + sent, bytes.size() - sent, MSG_NOSIGNAL | MSG_DONTWAIT);
      if (count <= 0) {
        break;
      }
      sent += static_cast<std::size_t>(count);
    }
    return sent;
  }

  // The next line; "(end)" when the server hangs up, "(none)" when nothing comes in time.
  std::string Line() {
    const Deadline deadline = Deadline::After(kLimitMs);
    for (;;) {
      const std::size_t end = input_.find('\n');
      if (end != std::string::npos) {
        const std::string line = input_.substr(0, end);
        input_.erase(0, end + 1);
        return line;
      }
      timeval limit{};
      limit.tv_sec = deadline.RemainingMs() / 1000 + 1;
      (void)setsockopt(descriptor_, SOL_SOCKET, SO_RCVTIMEO, &limit, sizeof limit);
      char bytes[65536];
      const ssize_t count = recv(descriptor_, bytes, sizeof bytes, 0);
      if (count <= 0) {
        return count == 0 || errno == ECONNRESET ? "(end)" : "(none)";
      }
      input_.append(bytes, static_cast<std::size_t>(count));
    }
  }

  nlohmann::json Ask(const std::string& request) {
    (void)Send(request + "\n");
    return nlohmann::json::parse(Line(), nullptr, false);
  }

 private:
  const int descriptor_;
  std::string input_;
};
