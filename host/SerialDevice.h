// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <memory>
#include <string>

#include "host/LineSettings.h"
#include "host/PortProblem.h"

// An open terminal device that belongs to this process alone: flock(2), which stops everybody who
// asks, and TIOCEXCL (ioctl_tty(2)), which stops everybody but root. Raw from the first moment on,
// not blocking, never the controlling terminal.
class SerialDevice {
 public:
  // Null, with the reason in `problem`, when the path is not there, not a terminal device, not
  // allowed or held by somebody. Host threads and the receive task.
  static std::shared_ptr<SerialDevice> Open(const std::string& path, PortProblem* problem);

  // Waits for bytes still on their way out for as long as the line needs, at most 2000 ms, drops
  // the rest and closes. A lost device is closed at once. Line settings stay as they are.
  ~SerialDevice();

  SerialDevice(const SerialDevice&) = delete;
  SerialDevice& operator=(const SerialDevice&) = delete;

  // Sets rate, character format and RS-485 direction control. False, with the reason in `why`, when
  // the settings are not valid or the device refuses them. `note` gets a text when the device
  // leaves direction control to its own electronics. What the device made of the settings is not
  // read back: a pseudo-terminal always reads back 8 bits without parity. Any thread.
  bool Apply(const LineSettings& settings, std::string* why, std::string* note) const;

  // The open file; valid as long as the object. Any thread.
  int FileDescriptor() const { return fileDescriptor_; }

  // Bytes in the output queue (TIOCOUTQ); 0 where the device does not tell. Any thread.
  int PendingBytes() const;

  // Says that the other end is gone. Receive task, before the last reference goes.
  void MarkLost() { isLost_ = true; }

 private:
  explicit SerialDevice(int fileDescriptor) : fileDescriptor_(fileDescriptor) {}

  void DrainForAWhile() const;

  const int fileDescriptor_;
  bool isLost_ = false;
};
