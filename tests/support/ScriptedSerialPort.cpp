// SPDX-License-Identifier: Apache-2.0
#include "tests/support/ScriptedSerialPort.h"

#include <utility>

#include "tests/support/HexDump.h"
#include "tests/support/HostCall.h"

namespace {

// Counts the calls that are inside the port, so that a release during a call is noticed.
class UseCount {
 public:
  explicit UseCount(std::atomic<int>& users) : users_(users) { ++users_; }
  ~UseCount() { --users_; }
  UseCount(const UseCount&) = delete;
  UseCount& operator=(const UseCount&) = delete;

 private:
  std::atomic<int>& users_;
};

}  // namespace

ScriptedSerialPort::ScriptedSerialPort(CallLog& log, FaultPlan& faults, std::string name,
                                       ScriptedLine& line)
    : log_(log), faults_(faults), name_(std::move(name)), line_(line) {}

void* ScriptedSerialPort::ConvertTo(const char* /*name*/) { return nullptr; }

void ScriptedSerialPort::reserved3() { log_.AddViolation("a reserved port operation was called"); }

void ScriptedSerialPort::reserved4() { log_.AddViolation("a reserved port operation was called"); }

void ScriptedSerialPort::CheckOpen(const char* operation) {
  if (released_) log_.AddViolation(std::string(operation) + " on a released port");
}

int ScriptedSerialPort::Setup(int baudrate, int parity, int dataBits, int stopBits, int mode) {
  const HostCall inside;
  const UseCount use(users_);
  CheckOpen("Setup");
  log_.Add("Setup " + std::to_string(baudrate) + " " + std::to_string(parity) + " " +
           std::to_string(dataBits) + " " + std::to_string(stopBits) + " " + std::to_string(mode));
  return faults_.IsToFail("Setup") ? 0 : 1;
}

int ScriptedSerialPort::Send(const unsigned char* data, int lengthBytes, int timeoutMs) {
  const HostCall inside;
  const UseCount use(users_);
  CheckOpen("Send");
  std::string line = "Send";
  if (lengthBytes < 0) {
    line += " length " + std::to_string(lengthBytes);
  } else if (lengthBytes > 0) {
    line += " " + HexDump(std::string(data, data + lengthBytes));
  }
  if (timeoutMs != 0) line += " timeout " + std::to_string(timeoutMs);
  log_.Add(line);
  return faults_.IsToFail("Send") ? 0 : 1;
}

int ScriptedSerialPort::Receive(unsigned char* byte, int timeoutMs, int reserved) {
  const HostCall inside;
  const UseCount use(users_);
  CheckOpen("Receive");
  if (reserved != 0) log_.AddViolation("Receive with a last argument other than 0");
  // A receive that fails is a time-out; the byte stays for the next one.
  const bool received = !faults_.IsToFail("Receive") && line_.Receive(byte, timeoutMs);
  CheckOpen("Receive");
  log_.Add("Receive " + std::to_string(timeoutMs) + " -> " +
           (received ? HexDump(std::string(1, static_cast<char>(*byte))) : "time-out"));
  return received ? 1 : 0;
}

void ScriptedSerialPort::MarkReleased() {
  if (released_.exchange(true)) log_.AddViolation("port " + name_ + " released twice");
  if (users_ != 0) log_.AddViolation("port " + name_ + " released while a call is inside it");
}
