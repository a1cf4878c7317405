// SPDX-License-Identifier: Apache-2.0
#include "driver/TaskRunner_LOKA.h"

#include <chrono>
#include <thread>

#include "driver/Protocol_LOKA.h"
#include "interfaces/IMultiTask2.h"
#include "interfaces/ITask.h"

namespace {

constexpr int kTaskClass = 3;
constexpr int kStopTimeoutMs = 1000;
constexpr int kYield = 0;
constexpr std::chrono::milliseconds kFinishPoll(1);

}  // namespace

TaskRunner_LOKA::TaskRunner_LOKA(IMultiTask2* multiTask, Protocol_LOKA& owner)
    : multiTask_(multiTask), owner_(owner) {}

void TaskRunner_LOKA::Task() {
  isRunning_ = true;
  for (ITask* task = task_; task != nullptr && task->IsToEnd() == 0; task = task_) {
    owner_.Task();
    multiTask_->Sleep(kYield);
  }
  isRunning_ = false;
}

void TaskRunner_LOKA::Start() {
  if (multiTask_ == nullptr || task_ != nullptr) {
    return;
  }
  ITask* task = multiTask_->CreateTask(this, kTaskClass);
  task_ = task;
  if (task != nullptr) {
    task->Start();
  }
}

void TaskRunner_LOKA::Stop() {
  ITask* task = task_;
  if (task != nullptr && multiTask_->StopTask(task, kStopTimeoutMs) != 0) {
    task_ = nullptr;
  }
}

void TaskRunner_LOKA::Finish() {
  Stop();
  task_ = nullptr;  // ends the loop of a task that goes on regardless
  while (isRunning_) {
    std::this_thread::sleep_for(kFinishPoll);
  }
}
