// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "interfaces/ISemaphore.h"
#include "protlib/LockOrder.h"

// Holds a host semaphore for a scope. A host that could not create the semaphore left a null: the
// scope then runs without it, and the driver's own leaf locks still keep the data whole.
class SemaphoreLock {
 public:
  // `rank` says which of the two semaphores it is, also when it is a null.
  SemaphoreLock(ISemaphore* semaphore, LockRank rank) : semaphore_(semaphore), rank_(rank) {
    if constexpr (kChecksLockOrder) {
      LockOrder::Check(rank_);
    }
    if (semaphore_ != nullptr) {
      semaphore_->Lock();
    }
    if constexpr (kChecksLockOrder) {
      LockOrder::Taken(rank_);
    }
  }
  ~SemaphoreLock() {
    if constexpr (kChecksLockOrder) {
      LockOrder::Freed(rank_);
    }
    if (semaphore_ != nullptr) {
      semaphore_->Unlock();
    }
  }
  SemaphoreLock(const SemaphoreLock&) = delete;
  SemaphoreLock& operator=(const SemaphoreLock&) = delete;

 private:
  ISemaphore* semaphore_;
  const LockRank rank_;
};
