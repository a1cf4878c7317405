// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <memory>
#include <string>

#include "host/base/ChildProcess.h"

class Deadline;

// The simulated device of the demonstration, seen from the host's process: a process of its own at
// the other end of a pseudo-terminal. One thread.
class DemoDevice {
 public:
  // Starts it. Throws std::exception when that fails.
  DemoDevice();

  // Path of the port that the host opens.
  const std::string& PortPath() const { return portPath_; }
  int ProcessId() const { return process_.ProcessId(); }

  // Makes the device send bytes; true once it has.
  bool Send(const std::string& bytes);

  // Waits until the device has seen `count` bytes since the last call and returns all of them, in
  // the order in which they came; fewer when the deadline passes first.
  std::string TakeSeen(std::size_t count, const Deadline& deadline);

 private:
  bool ReadReport(const Deadline& deadline, std::string* kind, std::string* value);

  ChildProcess process_;
  std::string portPath_;
  std::string seen_;
};

// The program of that process. It prints "port PATH", then for each byte of the host a line "saw"
// with the byte in hexadecimal; the line "send 02 41" on stdin makes it send these bytes and answer
// "sent". Ends with stdin. Returns the exit status.
int RunDemoDevice();
