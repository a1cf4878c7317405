// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <thread>
#include <vector>

#include "host/runtime/PosixSemaphore.h"

namespace {

// Waits, without a time, until so many threads hold the semaphore or wait for it.
void AwaitUsers(const PosixSemaphore& semaphore, unsigned int count) {
  while (semaphore.UserCount() != count) {
    std::this_thread::yield();
  }
}

TEST(PosixSemaphore, IsFreeAtFirstAndTakenOnce) {
  PosixSemaphore semaphore;
  EXPECT_EQ(semaphore.UserCount(), 0U);
  EXPECT_EQ(semaphore.Lock(), 1);
  EXPECT_EQ(semaphore.UserCount(), 1U);
  EXPECT_EQ(semaphore.Unlock(), 1);
  EXPECT_EQ(semaphore.UserCount(), 0U);
}

TEST(PosixSemaphore, RefusesToFreeWhatIsFree) {
  PosixSemaphore semaphore;
  EXPECT_EQ(semaphore.Unlock(), 0);
  EXPECT_EQ(semaphore.UserCount(), 0U);
  // The refusal left no turn behind: it still excludes.
  semaphore.Lock();
  bool isSecondIn = false;
  std::thread second([&] {
    semaphore.Lock();
    isSecondIn = true;
    semaphore.Unlock();
  });
  AwaitUsers(semaphore, 2);
  EXPECT_FALSE(isSecondIn);
  EXPECT_EQ(semaphore.Unlock(), 1);
  second.join();
  EXPECT_TRUE(isSecondIn);
}

TEST(PosixSemaphore, AnswersItsNames) {
  PosixSemaphore semaphore;
  EXPECT_EQ(semaphore.ConvertTo("ISemaphore"), &semaphore);
  EXPECT_EQ(semaphore.ConvertTo("PosixSemaphore"), &semaphore);
  EXPECT_EQ(semaphore.ConvertTo("isemaphore"), nullptr);
  EXPECT_EQ(semaphore.ConvertTo(nullptr), nullptr);
}

TEST(PosixSemaphore, ServesInOrderOfArrival) {
  // More than 32, so that some of them share a wake-up bit.
  constexpr unsigned int kThreads = 40;
  PosixSemaphore semaphore;
  std::vector<unsigned int> order;  // guarded by the semaphore
  std::vector<std::thread> threads;
  semaphore.Lock();
  for (unsigned int i = 0; i < kThreads; ++i) {
    threads.emplace_back([&, i] {
      semaphore.Lock();
      order.push_back(i);
      semaphore.Unlock();
    });
    AwaitUsers(semaphore, i + 2);
  }
  semaphore.Unlock();
  for (std::thread& thread : threads) {
    thread.join();
  }
  ASSERT_EQ(order.size(), kThreads);
  for (unsigned int i = 0; i < kThreads; ++i) {
    EXPECT_EQ(order[i], i);
  }
}

TEST(PosixSemaphore, ThreadThatLocksAgainAtOnceStandsBehindTheOneThatWaits) {
  constexpr int kRounds = 200;
  PosixSemaphore semaphore;
  std::vector<char> order;  // guarded by the semaphore
  for (int round = 0; round < kRounds; ++round) {
    order.clear();
    semaphore.Lock();
    std::thread waiting([&] {
      semaphore.Lock();
      order.push_back('w');
      semaphore.Unlock();
    });
    AwaitUsers(semaphore, 2);
    order.push_back('a');
    semaphore.Unlock();
    semaphore.Lock();
    order.push_back('a');
    semaphore.Unlock();
    waiting.join();
    ASSERT_EQ(std::string(order.begin(), order.end()), "awa");
  }
}

TEST(PosixSemaphore, ExcludesAndLosesNoTurnUnderContention) {
  constexpr int kThreads = 4;
  constexpr int kTurns = 5000;
  PosixSemaphore semaphore;
  int counter = 0;  // guarded by the semaphore
  std::vector<std::thread> threads;
  for (int i = 0; i < kThreads; ++i) {
    threads.emplace_back([&] {
      for (int turn = 0; turn < kTurns; ++turn) {
        semaphore.Lock();
        ++counter;
        EXPECT_EQ(semaphore.Unlock(), 1);
      }
    });
  }
  for (std::thread& thread : threads) {
    thread.join();
  }
  EXPECT_EQ(counter, kThreads * kTurns);
  EXPECT_EQ(semaphore.UserCount(), 0U);
}

}  // namespace
