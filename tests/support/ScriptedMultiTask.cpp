// SPDX-License-Identifier: Apache-2.0
#include "tests/support/ScriptedMultiTask.h"

#include <algorithm>
#include <thread>
#include <utility>

#include "interfaces/CompareInterface.h"
#include "tests/support/HostCall.h"
#include "tests/support/ReceiveTaskMark.h"

void* ScriptedMultiTask::ConvertTo(const char* name) {
  return CompareInterface(name, "IMultiTask2") ? this : nullptr;
}

void ScriptedMultiTask::reserved5() { log_.AddViolation("a reserved task operation was called"); }
void ScriptedMultiTask::reserved10() { log_.AddViolation("a reserved task operation was called"); }
void ScriptedMultiTask::reserved11() { log_.AddViolation("a reserved task operation was called"); }
void ScriptedMultiTask::reserved12() { log_.AddViolation("a reserved task operation was called"); }

int ScriptedMultiTask::StopTask(ITask* task, int timeoutMs) {
  const HostCall inside;
  ScriptedTask* known = nullptr;
  std::function<void()> action;
  {
    const std::lock_guard<std::mutex> guard(mutex_);
    for (const auto& candidate : tasks_) {
      if (candidate.get() == task) known = candidate.get();
    }
    action = std::exchange(onNextStop_, nullptr);
  }
  if (action) action();
  if (known == nullptr || known->IsEnded()) {
    log_.AddViolation("StopTask of a task that is not there");
    return 0;
  }
  if (faults_.IsToFail("StopTask")) {
    known->AskToEnd();
    log_.Add("StopTask " + std::to_string(timeoutMs) + " -> 0");
    return 0;
  }
  known->End();
  log_.Add("StopTask " + std::to_string(timeoutMs) + " -> 1");
  return 1;
}

ISemaphore* ScriptedMultiTask::CreateSemaphore(int reserved) {
  const HostCall inside;
  const std::lock_guard<std::mutex> guard(mutex_);
  const int index = createdSemaphores_++;
  const bool isQueue = index % 2 == 0;
  const std::string name =
      (isQueue ? "queue" : "port") + (index < 2 ? std::string() : std::to_string(index / 2 + 1));
  if (reserved != 0) log_.AddViolation("CreateSemaphore with an argument other than 0");
  if (faults_.IsToFail("CreateSemaphore")) {
    log_.Add("CreateSemaphore -> null");
    return nullptr;
  }
  log_.Add("CreateSemaphore -> " + name);
  semaphores_.push_back(std::make_unique<ScriptedSemaphore>(
      log_, name, isQueue ? ScriptedSemaphore::Kind::kQueue : ScriptedSemaphore::Kind::kPort));
  return semaphores_.back().get();
}

void ScriptedMultiTask::DeleteSemaphore(ISemaphore* semaphore) {
  const HostCall inside;
  const std::lock_guard<std::mutex> guard(mutex_);
  for (const auto& known : semaphores_) {
    if (known.get() != semaphore) continue;
    log_.Add("DeleteSemaphore " + known->Name());
    known->MarkDeleted();
    return;
  }
  log_.AddViolation("DeleteSemaphore of a semaphore that was never created");
}

void ScriptedMultiTask::Sleep(int milliseconds) {
  const HostCall inside;
  log_.Add("Sleep " + std::to_string(milliseconds));
  std::function<void(int)> action;
  {
    const std::lock_guard<std::mutex> guard(mutex_);
    action = onSleep_;
  }
  if (action) {
    const ReceiveTaskMark anotherThread(false);
    action(milliseconds);
  }
  // Time stands still here; a thread only lets others run.
  if (threaded_) std::this_thread::yield();
}

ITask* ScriptedMultiTask::CreateTask(ITaskRunner* runner, int taskClass) {
  const HostCall inside;
  log_.Add("CreateTask " + std::to_string(taskClass));
  if (runner == nullptr) log_.AddViolation("CreateTask without a runner");
  if (faults_.IsToFail("CreateTask")) return nullptr;
  const std::lock_guard<std::mutex> guard(mutex_);
  tasks_.push_back(std::make_unique<ScriptedTask>(log_, faults_, runner, threaded_));
  return tasks_.back().get();
}

void ScriptedMultiTask::OnSleep(std::function<void(int)> action) {
  const std::lock_guard<std::mutex> guard(mutex_);
  onSleep_ = std::move(action);
}

void ScriptedMultiTask::OnNextStop(std::function<void()> action) {
  const std::lock_guard<std::mutex> guard(mutex_);
  onNextStop_ = std::move(action);
}

ScriptedTask* ScriptedMultiTask::LastTask() {
  const std::lock_guard<std::mutex> guard(mutex_);
  return tasks_.empty() ? nullptr : tasks_.back().get();
}

ScriptedSemaphore* ScriptedMultiTask::Semaphore(const std::string& name) {
  const std::lock_guard<std::mutex> guard(mutex_);
  for (const auto& semaphore : semaphores_) {
    if (semaphore->Name() == name) return semaphore.get();
  }
  return nullptr;
}

bool ScriptedMultiTask::IsAnySemaphoreHeld() const {
  const std::lock_guard<std::mutex> guard(mutex_);
  return std::any_of(semaphores_.begin(), semaphores_.end(),
                     [](const auto& semaphore) { return semaphore->IsHeld(); });
}

std::string ScriptedMultiTask::Leftovers() const {
  const std::lock_guard<std::mutex> guard(mutex_);
  std::string text;
  for (const auto& semaphore : semaphores_) {
    if (semaphore->IsHeld()) text += semaphore->Name() + " is still held\n";
    if (!semaphore->IsDeleted()) text += semaphore->Name() + " was not deleted\n";
  }
  for (const auto& task : tasks_) {
    if (task->IsStarted() && !task->IsEnded()) text += "a task was not stopped\n";
  }
  return text;
}
