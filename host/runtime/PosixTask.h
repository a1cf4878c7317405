// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <atomic>
#include <condition_variable>
#include <memory>
#include <mutex>
#include <thread>

#include "interfaces/ITask.h"

class Deadline;
class ITaskRunner;

// A host task: one thread that calls a runner once and ends when the runner returns. Ending is
// cooperative: the runner asks IsToEnd. Owned by PosixMultiTask; the thread keeps what it needs
// alive on its own, so a task that does not end in time harms nobody.
class PosixTask final : public ITask {
 public:
  // The runner stays owned by the caller and must live until the task has ended.
  explicit PosixTask(ITaskRunner* runner);

  // A thread that has not ended is left to itself.
  ~PosixTask() override;

  PosixTask(const PosixTask&) = delete;
  PosixTask& operator=(const PosixTask&) = delete;

  // Answers "PosixTask" and "ITask".
  void* ConvertTo(const char* name) override;

  // Non-zero once RequestEnd was called. Any thread.
  int IsToEnd() override;

  void reserved4() override {}

  // Starts the thread. 0 when it was started before or the system has no thread left. Host threads.
  int Start() override;

  // Makes IsToEnd answer yes. A task that was not started then counts as ended. Any thread.
  void RequestEnd();

  // Waits until the runner has returned; true when it has. Any thread but the task's own.
  bool WaitForEnd(const Deadline& deadline);

  // Whether the calling thread is the task's own.
  bool IsCurrentThread() const;

 private:
  // What the thread and the task share; whichever goes last frees it.
  struct State {
    std::mutex mutex;
    std::condition_variable changed;
    bool isStarted = false;
    bool isEnded = false;
    std::atomic<bool> isToEnd{false};
  };

  ITaskRunner* const runner_;
  const std::shared_ptr<State> state_;
  std::thread thread_;
};
