// SPDX-License-Identifier: Apache-2.0
#pragma once

// What a host task runs. Implemented by the plug-in, which keeps the object alive until the task
// has been stopped.
class ITaskRunner {
 public:
  // slots 0, 1
  virtual ~ITaskRunner() = default;

  // slot 2. The whole life of the task: returns when the task is asked to end. Called once, on the
  // task's own thread.
  virtual void Task() = 0;
};
