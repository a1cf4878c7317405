// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "interfaces/IInterface.h"

// A host semaphore, used as a lock: free when created, taken by one thread at a time, not
// recursive.
class ISemaphore : public IInterface {
 public:
  // slot 3. Waits until the semaphore is free and takes it. Any thread.
  virtual int Lock() = 0;

  // slot 4. Frees the semaphore. Called by the thread that took it.
  virtual int Unlock() = 0;
};
