// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "interfaces/INamedInterface.h"

class ISemaphore;
class ITask;
class ITaskRunner;

// Host service for tasks, semaphores and sleeping. Required.
class IMultiTask2 : public INamedInterface {
 public:
  // slot 5. Never called.
  virtual void reserved5() = 0;

  // slot 6. Asks a task to end and waits for it, at most timeoutMs milliseconds. Non-zero when the
  // task has ended; its handle is then no longer valid. Host threads, never the task itself.
  virtual int StopTask(ITask* task, int timeoutMs) = 0;

  // slot 7. Returns a free semaphore, or null. The argument is always 0. Handed back with
  // DeleteSemaphore. Host threads.
  virtual ISemaphore* CreateSemaphore(int reserved) = 0;

  // slot 8. Takes back a semaphore that CreateSemaphore returned and nobody holds. Host threads.
  virtual void DeleteSemaphore(ISemaphore* semaphore) = 0;

  // slot 9. Suspends the calling thread for the given milliseconds; 0 only yields. Any thread.
  virtual void Sleep(int milliseconds) = 0;

  // slots 10 to 12. Never called.
  virtual void reserved10() = 0;
  virtual void reserved11() = 0;
  virtual void reserved12() = 0;

  // slot 13. Returns a task that is not running yet, or null. The runner stays owned by the caller.
  // The driver passes taskClass 3. The task stays owned by the host (see ITask). Host threads.
  virtual ITask* CreateTask(ITaskRunner* runner, int taskClass) = 0;
};
