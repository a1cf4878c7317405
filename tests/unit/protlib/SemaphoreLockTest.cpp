// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <stdexcept>

#include "protlib/SemaphoreLock.h"
#include "tests/support/ScriptedSemaphore.h"

TEST(SemaphoreLockTest, HoldsTheSemaphoreForTheScope) {
  CallLog log;
  ScriptedSemaphore semaphore(log, "queue", ScriptedSemaphore::Kind::kQueue);
  {
    const SemaphoreLock lock(&semaphore, LockRank::kQueueSemaphore);
    EXPECT_TRUE(semaphore.IsHeld());
  }
  EXPECT_FALSE(semaphore.IsHeld());
  EXPECT_EQ(log.Text(), "queue.Lock\nqueue.Unlock\n");
}

TEST(SemaphoreLockTest, FreesTheSemaphoreWhenTheScopeIsLeftByAnException) {
  CallLog log;
  ScriptedSemaphore semaphore(log, "queue", ScriptedSemaphore::Kind::kQueue);
  EXPECT_THROW(
      {
        const SemaphoreLock lock(&semaphore, LockRank::kQueueSemaphore);
        throw std::runtime_error("on the way");
      },
      std::runtime_error);
  EXPECT_FALSE(semaphore.IsHeld());
}

TEST(SemaphoreLockTest, RunsWithoutASemaphore) {
  const SemaphoreLock lock(nullptr, LockRank::kPortSemaphore);
}
