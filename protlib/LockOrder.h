// SPDX-License-Identifier: Apache-2.0
#pragma once

// The order in which a thread may take the driver's locks, checked in debug builds: a wrong order
// is a deadlock that waits for its moment, and it shows here on one thread and without that moment.
// In release builds nothing of this is left.

// In the order of taking: a thread takes only locks that stand behind every lock it holds.
enum class LockRank {
  kLife,            // Start and Stop
  kQueueSemaphore,  // of the host
  kPortSemaphore,   // of the host
  kPortUse,         // a send, a set-up, opening and closing
  kLeaf,            // everything else
};

#ifdef NDEBUG
inline constexpr bool kChecksLockOrder = false;
#else
inline constexpr bool kChecksLockOrder = true;
#endif

// What the calling thread holds. Any thread; allocates nothing.
namespace LockOrder {

// Ends the process, with the two locks on standard error, when the thread holds a lock of the same
// rank or of one behind it. Called before the thread waits for the lock.
void Check(LockRank rank);

// Notes that the thread holds the lock, and that it does not hold it any more.
void Taken(LockRank rank);
void Freed(LockRank rank);

}  // namespace LockOrder

// Checks and notes a lock of another kind for a scope; stands in front of it.
class LockOrderScope {
 public:
  explicit LockOrderScope(LockRank rank) : rank_(rank) {
    if constexpr (kChecksLockOrder) {
      LockOrder::Check(rank_);
      LockOrder::Taken(rank_);
    }
  }
  ~LockOrderScope() {
    if constexpr (kChecksLockOrder) {
      LockOrder::Freed(rank_);
    }
  }
  LockOrderScope(const LockOrderScope&) = delete;
  LockOrderScope& operator=(const LockOrderScope&) = delete;

 private:
  const LockRank rank_;
};
