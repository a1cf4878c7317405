// SPDX-License-Identifier: Apache-2.0
#include "tests/support/ScriptedTask.h"

#include <utility>

#include "tests/support/HostCall.h"
#include "tests/support/ReceiveTaskMark.h"

ScriptedTask::ScriptedTask(CallLog& log, FaultPlan& faults, ITaskRunner* runner, bool threaded)
    : log_(log), faults_(faults), runner_(runner), threaded_(threaded) {}

ScriptedTask::~ScriptedTask() {
  toEnd_ = true;
  if (thread_.joinable()) thread_.join();
}

void* ScriptedTask::ConvertTo(const char* /*name*/) { return nullptr; }

int ScriptedTask::IsToEnd() {
  const HostCall inside;
  if (ended_ && !threaded_) log_.AddViolation("IsToEnd of a task that has been stopped");
  const bool toEnd = toEnd_ || (isDone_ && isDone_());
  log_.Add(toEnd ? "IsToEnd -> 1" : "IsToEnd -> 0");
  return toEnd ? 1 : 0;
}

void ScriptedTask::reserved4() { log_.AddViolation("a reserved task operation was called"); }

int ScriptedTask::Start() {
  const HostCall inside;
  log_.Add("task.Start");
  if (started_) log_.AddViolation("a task was started twice");
  started_ = true;
  if (faults_.IsToFail("task.Start")) return 0;
  if (threaded_) {
    thread_ = std::thread([this] {
      const ReceiveTaskMark mark(true);
      runner_->Task();
    });
  }
  return 1;
}

void ScriptedTask::RunPasses(int count) {
  RunUntil([count]() mutable { return count-- <= 0; });
}

void ScriptedTask::RunUntil(std::function<bool()> isDone) {
  isDone_ = std::move(isDone);
  const ReceiveTaskMark mark(true);
  runner_->Task();
  isDone_ = nullptr;
}

void ScriptedTask::End() {
  toEnd_ = true;
  if (thread_.joinable()) thread_.join();
  ended_ = true;
}
