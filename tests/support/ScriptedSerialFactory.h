// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <map>
#include <memory>
#include <mutex>
#include <string>
#include <vector>

#include "interfaces/ISerialFactory.h"
#include "tests/support/ScriptedSerialPort.h"

// Opens scripted lines by any name. Each opening is an object of its own on the line of that name,
// and stays in memory after its release so that late use is noticed.
class ScriptedSerialFactory final : public ISerialFactory {
 public:
  ScriptedSerialFactory(CallLog& log, FaultPlan& faults) : log_(log), faults_(faults) {}

  void* ConvertTo(const char* name) override;
  const char* GetImpName() const override { return nameless_ ? nullptr : "ScriptedSerial"; }
  int GetImpVersion() const override { return 7; }
  ISerialPort* OpenPort(const char* name) override;
  void ReleasePort(ISerialPort* port) override;

  ScriptedLine& Line(const std::string& portName);
  int OpenCount() const;
  // Answers null for its implementation name.
  void SetNameless(bool nameless) { nameless_ = nameless; }

 private:
  CallLog& log_;
  FaultPlan& faults_;
  bool nameless_ = false;
  mutable std::mutex mutex_;
  std::map<std::string, ScriptedLine> lines_;
  std::vector<std::unique_ptr<ScriptedSerialPort>> ports_;
};
