// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <atomic>
#include <string>

#include "interfaces/ISerialPort.h"
#include "tests/support/CallLog.h"
#include "tests/support/FaultPlan.h"
#include "tests/support/ScriptedLine.h"

// One opening of a scripted line. Records every call; any use after the release is a violation.
class ScriptedSerialPort final : public ISerialPort {
 public:
  ScriptedSerialPort(CallLog& log, FaultPlan& faults, std::string name, ScriptedLine& line);

  void* ConvertTo(const char* name) override;
  void reserved3() override;
  void reserved4() override;
  int Setup(int baudrate, int parity, int dataBits, int stopBits, int mode) override;
  int Send(const unsigned char* data, int lengthBytes, int timeoutMs) override;
  int Receive(unsigned char* byte, int timeoutMs, int reserved) override;

  const std::string& Name() const { return name_; }
  void MarkReleased();
  bool IsReleased() const { return released_; }

 private:
  void CheckOpen(const char* operation);

  CallLog& log_;
  FaultPlan& faults_;
  const std::string name_;
  ScriptedLine& line_;
  std::atomic<bool> released_{false};
  std::atomic<int> users_{0};
};
