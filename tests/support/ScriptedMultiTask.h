// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>
#include <memory>
#include <mutex>
#include <string>
#include <vector>

#include "interfaces/IMultiTask2.h"
#include "tests/support/CallLog.h"
#include "tests/support/FaultPlan.h"
#include "tests/support/ScriptedSemaphore.h"
#include "tests/support/ScriptedTask.h"

// Tasks and semaphores. A protocol creates its queue semaphore first and its port semaphore second,
// so the n-th pair is named "queue" and "port" (from the second protocol on "queue2", "port2").
class ScriptedMultiTask final : public IMultiTask2 {
 public:
  ScriptedMultiTask(CallLog& log, FaultPlan& faults) : log_(log), faults_(faults) {}

  // Set before the first task is created.
  void SetThreaded(bool threaded) { threaded_ = threaded; }

  void* ConvertTo(const char* name) override;
  const char* GetImpName() const override { return "ScriptedTasks"; }
  int GetImpVersion() const override { return 3; }
  void reserved5() override;
  int StopTask(ITask* task, int timeoutMs) override;
  ISemaphore* CreateSemaphore(int reserved) override;
  void DeleteSemaphore(ISemaphore* semaphore) override;
  void Sleep(int milliseconds) override;
  void reserved10() override;
  void reserved11() override;
  void reserved12() override;
  ITask* CreateTask(ITaskRunner* runner, int taskClass) override;

  // Runs on the sleeping thread inside every Sleep of the receive task, to act between two passes.
  void OnSleep(std::function<void(int milliseconds)> action);
  // Runs on the stopping thread inside the next StopTask, in front of the task\'s end.
  void OnNextStop(std::function<void()> action);

  ScriptedTask* LastTask();
  ScriptedSemaphore* Semaphore(const std::string& name);
  bool IsAnySemaphoreHeld() const;
  // What is still held, not deleted or not stopped; empty when everything is as it should be.
  std::string Leftovers() const;

 private:
  CallLog& log_;
  FaultPlan& faults_;
  bool threaded_ = false;
  mutable std::mutex mutex_;
  std::function<void(int)> onSleep_;
  std::function<void()> onNextStop_;
  int createdSemaphores_ = 0;
  std::vector<std::unique_ptr<ScriptedSemaphore>> semaphores_;
  std::vector<std::unique_ptr<ScriptedTask>> tasks_;
};
