// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <thread>

#include "protlib/LeafMutex.h"
#include "protlib/LockOrder.h"
#include "protlib/SemaphoreLock.h"

// The order is only checked in debug builds.
#ifndef NDEBUG

namespace {

void TakeBoth(LockRank first, LockRank second) {
  const SemaphoreLock outer(nullptr, first);
  const SemaphoreLock inner(nullptr, second);
}

void TakeLeafInLeaf() {
  LeafMutex first;
  LeafMutex second;
  const LeafLock outer(first);
  const LeafLock inner(second);
}

void TakeSemaphoreInLeaf() {
  LeafMutex leaf;
  const LeafLock outer(leaf);
  const SemaphoreLock inner(nullptr, LockRank::kQueueSemaphore);
}

}  // namespace

TEST(LockOrderTest, TheRightOrderIsTakenAgainAndAgain) {
  LeafMutex use(LockRank::kPortUse);
  LeafMutex leaf;
  for (int i = 0; i < 3; ++i) {
    const LockOrderScope life(LockRank::kLife);
    const SemaphoreLock queue(nullptr, LockRank::kQueueSemaphore);
    const SemaphoreLock port(nullptr, LockRank::kPortSemaphore);
    const LeafLock useLock(use);
    const LeafLock leafLock(leaf);
  }
}

TEST(LockOrderTest, AnotherThreadHoldsWhatItLikes) {
  const SemaphoreLock port(nullptr, LockRank::kPortSemaphore);
  std::thread([] { TakeBoth(LockRank::kQueueSemaphore, LockRank::kPortSemaphore); }).join();
}

TEST(LockOrderDeathTest, QueueBehindPort) {
  EXPECT_DEATH(TakeBoth(LockRank::kPortSemaphore, LockRank::kQueueSemaphore),
               "lock order: queue semaphore taken behind port semaphore");
}

TEST(LockOrderDeathTest, TheSameTwice) {
  EXPECT_DEATH(TakeBoth(LockRank::kQueueSemaphore, LockRank::kQueueSemaphore),
               "lock order: queue semaphore taken behind queue semaphore");
}

TEST(LockOrderDeathTest, TwoLeaves) {
  EXPECT_DEATH(TakeLeafInLeaf(), "lock order: leaf lock taken behind leaf lock");
}

TEST(LockOrderDeathTest, SemaphoreInALeaf) {
  EXPECT_DEATH(TakeSemaphoreInLeaf(), "lock order: queue semaphore taken behind leaf lock");
}

#endif
