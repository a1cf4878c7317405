// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <atomic>
#include <functional>
#include <thread>

#include "interfaces/ITask.h"
#include "interfaces/ITaskRunner.h"
#include "tests/support/CallLog.h"
#include "tests/support/FaultPlan.h"

// A host task. In a manual host the test runs the runner on its own thread, for an exact number of
// passes or until a condition holds; in a threaded host Start makes a real thread.
class ScriptedTask final : public ITask {
 public:
  ScriptedTask(CallLog& log, FaultPlan& faults, ITaskRunner* runner, bool threaded);
  ~ScriptedTask() override;
  ScriptedTask(const ScriptedTask&) = delete;
  ScriptedTask& operator=(const ScriptedTask&) = delete;

  void* ConvertTo(const char* name) override;
  int IsToEnd() override;
  void reserved4() override;
  int Start() override;

  // Manual host: one life of the runner that is told to end after that many passes, or at the first
  // pass in front of which `isDone` holds.
  void RunPasses(int count);
  void RunUntil(std::function<bool()> isDone);

  // The host's stop: asks the task to end and, in a threaded host, waits for it.
  void End();
  // Asks only.
  void AskToEnd() { toEnd_ = true; }
  bool IsAskedToEnd() const { return toEnd_; }
  bool IsEnded() const { return ended_; }
  bool IsStarted() const { return started_; }

 private:
  CallLog& log_;
  FaultPlan& faults_;
  ITaskRunner* const runner_;
  const bool threaded_;
  std::atomic<bool> toEnd_{false};
  std::atomic<bool> ended_{false};
  std::atomic<bool> started_{false};
  std::function<bool()> isDone_;
  std::thread thread_;
};
