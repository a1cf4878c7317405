// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <string_view>

class Deadline;

// The device's end of a pseudo-terminal (pty(7)). A host opens the other end under Path(). That end
// is kept open here as well, raw, so that bytes written early wait for the host and a host that
// closes it does not end the line. One thread.
class PseudoTerminal {
 public:
  // Opens a new pair. Throws std::system_error when the system has none left.
  PseudoTerminal();

  // Closes the pair; a host at the other end sees the line hang up.
  ~PseudoTerminal();

  PseudoTerminal(const PseudoTerminal&) = delete;
  PseudoTerminal& operator=(const PseudoTerminal&) = delete;

  // Path of the host's end.
  const std::string& Path() const { return path_; }

  // The device's end, not blocking.
  int FileDescriptor() const { return deviceEnd_; }

  // Sends all bytes to the host; false when the deadline passes first.
  bool Send(std::string_view bytes, const Deadline& deadline) const;

  // Appends what the host has sent until `bytes` holds `count` bytes or the deadline has passed.
  // True when it holds them.
  bool Receive(std::size_t count, const Deadline& deadline, std::string* bytes) const;

 private:
  int deviceEnd_ = -1;
  int hostEnd_ = -1;
  std::string path_;
};
