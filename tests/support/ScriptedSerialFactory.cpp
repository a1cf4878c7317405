// SPDX-License-Identifier: Apache-2.0
#include "tests/support/ScriptedSerialFactory.h"

#include "interfaces/CompareInterface.h"
#include "tests/support/HostCall.h"

void* ScriptedSerialFactory::ConvertTo(const char* name) {
  return CompareInterface(name, "ISerialFactory") ? this : nullptr;
}

ISerialPort* ScriptedSerialFactory::OpenPort(const char* name) {
  const HostCall inside;
  const std::string portName = name != nullptr ? name : "(null)";
  log_.Add("OpenPort " + portName);
  if (faults_.IsToFail("OpenPort")) return nullptr;
  ScriptedLine& line = Line(portName);
  const std::lock_guard<std::mutex> guard(mutex_);
  ports_.push_back(std::make_unique<ScriptedSerialPort>(log_, faults_, portName, line));
  return ports_.back().get();
}

void ScriptedSerialFactory::ReleasePort(ISerialPort* port) {
  const HostCall inside;
  const std::lock_guard<std::mutex> guard(mutex_);
  for (const auto& known : ports_) {
    if (known.get() != port) continue;
    log_.Add("ReleasePort " + known->Name());
    known->MarkReleased();
    return;
  }
  log_.AddViolation("ReleasePort of a port that was never opened");
}

ScriptedLine& ScriptedSerialFactory::Line(const std::string& portName) {
  const std::lock_guard<std::mutex> guard(mutex_);
  return lines_[portName];
}

int ScriptedSerialFactory::OpenCount() const {
  const std::lock_guard<std::mutex> guard(mutex_);
  int count = 0;
  for (const auto& port : ports_) count += port->IsReleased() ? 0 : 1;
  return count;
}
