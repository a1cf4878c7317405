// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <mutex>

#include "protlib/LockOrder.h"
#include "protlib/ThreadAnnotations.h"

// A lock inside the driver that the host never sees. It is a leaf: whoever holds it takes no other
// lock and calls no host operation that can block. The one exception is the lock of SerialLink that
// keeps a port alive while it sends; it says so there.
class LOKA_CAPABILITY("mutex") LeafMutex {
 public:
  explicit LeafMutex(LockRank rank = LockRank::kLeaf) : rank_(rank) {}

  void Lock() LOKA_ACQUIRE() {
    if constexpr (kChecksLockOrder) {
      LockOrder::Check(rank_);
      LockOrder::Taken(rank_);
    }
    mutex_.lock();
  }
  void Unlock() LOKA_RELEASE() {
    mutex_.unlock();
    if constexpr (kChecksLockOrder) {
      LockOrder::Freed(rank_);
    }
  }

 private:
  std::mutex mutex_;
  const LockRank rank_;
};

// Holds a LeafMutex for a scope.
class LOKA_SCOPED_CAPABILITY LeafLock {
 public:
  explicit LeafLock(LeafMutex& mutex) LOKA_ACQUIRE(mutex) : mutex_(mutex) { mutex_.Lock(); }
  ~LeafLock() LOKA_RELEASE() { mutex_.Unlock(); }
  LeafLock(const LeafLock&) = delete;
  LeafLock& operator=(const LeafLock&) = delete;

 private:
  LeafMutex& mutex_;
};
