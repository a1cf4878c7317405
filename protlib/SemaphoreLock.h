// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "interfaces/ISemaphore.h"

// Holds a host semaphore for a scope. A host that could not create the semaphore left a null: the
// scope then runs without it, and the driver's own leaf locks still keep the data whole.
class SemaphoreLock {
 public:
  explicit SemaphoreLock(ISemaphore* semaphore) : semaphore_(semaphore) {
    if (semaphore_ != nullptr) {
      semaphore_->Lock();
    }
  }
  ~SemaphoreLock() {
    if (semaphore_ != nullptr) {
      semaphore_->Unlock();
    }
  }
  SemaphoreLock(const SemaphoreLock&) = delete;
  SemaphoreLock& operator=(const SemaphoreLock&) = delete;

 private:
  ISemaphore* semaphore_;
};
