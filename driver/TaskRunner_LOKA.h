// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <atomic>

#include "protlib/MultiTaskN.h"

class IMultiTask2;
class ITask;
class Protocol_LOKA;

// The receive task of one protocol: asks the host for a task and lets it run the protocol's receive
// passes until it is asked to end.
class TaskRunner_LOKA : public MultiTaskN::TaskRunner {
 public:
  // The task service may be null: nothing is then ever received.
  TaskRunner_LOKA(IMultiTask2* multiTask, Protocol_LOKA& owner);
  TaskRunner_LOKA(const TaskRunner_LOKA&) = delete;
  TaskRunner_LOKA& operator=(const TaskRunner_LOKA&) = delete;
  ~TaskRunner_LOKA() override = default;

  // Passes and yields in turn until the task is asked to end. Receive task.
  void Task() override;

  // Creates and starts a task, unless one is held from before. Host threads.
  void Start();

  // Asks the task to end, for at most 1000 ms. A task that did not end stays held. Host threads.
  void Stop();

  // For the protocol's end: stops the task and waits until it has left Task(), also when the host
  // reports that it did not end in time.
  void Finish();

  IMultiTask2* MultiTask() const { return multiTask_; }

 private:
  IMultiTask2* const multiTask_;
  Protocol_LOKA& owner_;
  std::atomic<ITask*> task_{nullptr};
  std::atomic<bool> isRunning_{false};
};
