// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <memory>
#include <mutex>
#include <vector>

#include "host/runtime/PosixSemaphore.h"
#include "host/runtime/PosixTask.h"
#include "interfaces/IMultiTask2.h"

// The host's task service on POSIX threads. Tasks and semaphores belong to it: a pointer that it
// does not know, or no longer knows, is refused instead of followed. Any thread.
class PosixMultiTask final : public IMultiTask2 {
 public:
  PosixMultiTask();

  // Asks every task that is left to end, but does not wait (see EndTasks); frees the semaphores.
  ~PosixMultiTask() override;

  PosixMultiTask(const PosixMultiTask&) = delete;
  PosixMultiTask& operator=(const PosixMultiTask&) = delete;

  // Answers "PosixMultiTask" and "IMultiTask2".
  void* ConvertTo(const char* name) override;
  const char* GetImpName() const override { return "PosixMultiTask"; }
  int GetImpVersion() const override { return 100; }

  void reserved5() override {}

  // Asks a task to end and waits at most timeoutMs milliseconds. 1 when it has ended; it is freed
  // then. 0 when it has not, and it stays valid and keeps running; 0 also for a pointer that is not
  // a task of ours and for a task that stops itself.
  int StopTask(ITask* task, int timeoutMs) override;

  // A free semaphore, or null when memory is short. The argument has no meaning here.
  ISemaphore* CreateSemaphore(int reserved) override;

  // Frees a semaphore. A pointer that is none of ours is ignored.
  void DeleteSemaphore(ISemaphore* semaphore) override;

  // 0 or less gives the processor away (sched_yield(2)), but only when the calling thread has not
  // done so since the last tick of the system's clock (a few milliseconds), so that a task that
  // yields between tokens pays next to nothing; otherwise sleeps the whole time.
  void Sleep(int milliseconds) override;

  void reserved10() override {}
  void reserved11() override {}
  void reserved12() override {}

  // A task that has yet to be started, or null without a runner or when memory is short. All task
  // classes are treated alike.
  ITask* CreateTask(ITaskRunner* runner, int taskClass) override;

  // Asks all tasks that are left to end and waits for them, at most timeoutMs milliseconds
  // altogether. True when none is left. Host threads.
  bool EndTasks(int timeoutMs);

  // Numbers of tasks and semaphores that were not handed back. Any thread.
  std::size_t TaskCount() const;
  std::size_t SemaphoreCount() const;

 private:
  std::shared_ptr<PosixTask> FindTask(const ITask* task) const;

  mutable std::mutex mutex_;
  std::vector<std::shared_ptr<PosixTask>> tasks_;
  std::vector<std::unique_ptr<PosixSemaphore>> semaphores_;
};
