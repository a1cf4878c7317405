// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>

class Deadline;

// The device's end of a pseudo-terminal (pty(7)) that can be pulled and plugged in again. Other
// than at a PseudoTerminal, the host's end is not kept open here, so the device notices who opens
// and closes it, as a real one does at the modem lines. Nothing is locked. Never waits, except in
// Drain. One thread.
class DevicePort {
 public:
  DevicePort() = default;
  ~DevicePort();

  DevicePort(const DevicePort&) = delete;
  DevicePort& operator=(const DevicePort&) = delete;

  // Makes a new pair in raw mode. Throws std::system_error when the system has none left.
  void Plug();

  // Takes the pair away; a host that has it open sees the line hang up.
  void Unplug();

  bool IsPlugged() const { return deviceEnd_ >= 0; }

  // Path of the host's end; empty while unplugged.
  const std::string& Path() const { return path_; }

  // The device's end, to wait for input; -1 while unplugged. poll(2) returns at once on it while no
  // host has the port open.
  int FileDescriptor() const { return deviceEnd_; }

  // True while a host has the port open.
  bool IsOpen() const;

  // Takes what the host has sent; also what it sent before it closed the port.
  std::string Read() const;

  // Sends as much as fits; returns how many bytes those were. None while no host has the port open.
  std::size_t Write(std::string_view bytes) const;

  // Drops what a host has left unread, so that the next one does not get it. Returns false when a
  // host that is gone has left the port locked (TIOCEXCL), as one does that is killed: on a
  // pseudo-terminal that lasts, and only a new port is of use to anybody.
  bool Flush() const;

  // Waits until the host has read everything, has closed the port or the deadline has passed.
  // Where the host keeps others from opening the port (TIOCEXCL), that cannot be seen; then a
  // second must do.
  void Drain(const Deadline& deadline) const;

 private:
  std::optional<int> UnreadBytes() const;

  int deviceEnd_ = -1;
  std::string path_;
};
