// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "interfaces/IInterface.h"

// A host task. Owned by the host; valid from IMultiTask2::CreateTask until IMultiTask2::StopTask
// has reported success.
class ITask : public IInterface {
 public:
  // slot 3. Non-zero once the task has been asked to end. Any thread, mostly the task's own.
  virtual int IsToEnd() = 0;

  // slot 4. Never called.
  virtual void reserved4() = 0;

  // slot 5. Starts the task's thread, which calls the runner. Non-zero on success. Host threads.
  virtual int Start() = 0;
};
