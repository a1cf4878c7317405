// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <chrono>
#include <cstdint>
#include <string>
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

// A thread takes the semaphore ('a'), lets it go while another one waits ('w') and takes it again
// at once. Returns who had it when.
std::string TurnsBesideAWaiter(PosixSemaphore& semaphore) {
  std::string order;  // guarded by the semaphore
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
  return order;
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
  for (int round = 0; round < kRounds; ++round) {
    ASSERT_EQ(TurnsBesideAWaiter(semaphore), "awa");
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

// Takes the semaphore as often as it needs to become its favourite, when the system offers that.
void BecomeFavourite(PosixSemaphore& semaphore) {
  for (std::uint32_t i = 0; i <= PosixSemaphore::kTurnsToFavour; ++i) {
    semaphore.Lock();
    semaphore.Unlock();
  }
}

TEST(PosixSemaphore, FavouriteTakesAndFreesLikeEverybody) {
  PosixSemaphore semaphore;
  BecomeFavourite(semaphore);
  if (!semaphore.HasFavourite()) {
    GTEST_SKIP() << "this system does not order memory for others";
  }
  EXPECT_EQ(semaphore.UserCount(), 0U);
  EXPECT_EQ(semaphore.Unlock(), 0);
  EXPECT_EQ(semaphore.Lock(), 1);
  EXPECT_EQ(semaphore.UserCount(), 1U);
  EXPECT_EQ(semaphore.Unlock(), 1);
  EXPECT_EQ(semaphore.Unlock(), 0);
  EXPECT_EQ(semaphore.UserCount(), 0U);
}

TEST(PosixSemaphore, FavouriteStandsBehindTheOneThatWaits) {
  PosixSemaphore semaphore;
  for (int round = 0; round < 10; ++round) {
    // Each time that the favour ends it is harder to get.
    for (std::uint32_t i = 0;
         i < PosixSemaphore::kTurnsToFavour << 11U && !semaphore.HasFavourite(); ++i) {
      semaphore.Lock();
      semaphore.Unlock();
    }
    ASSERT_EQ(TurnsBesideAWaiter(semaphore), "awa");
    EXPECT_FALSE(semaphore.HasFavourite());
  }
}

TEST(PosixSemaphore, WakesWhoHasFallenAsleepBehindATurnAndBehindAFavourite) {
  constexpr std::chrono::milliseconds kLongerThanAnybodyLooks(50);
  for (const bool isByFavour : {false, true}) {
    PosixSemaphore semaphore;
    if (isByFavour) {
      BecomeFavourite(semaphore);
    }
    semaphore.Lock();
    std::thread second([&] {
      semaphore.Lock();
      semaphore.Unlock();
    });
    AwaitUsers(semaphore, 2);
    std::this_thread::sleep_for(kLongerThanAnybodyLooks);
    EXPECT_EQ(semaphore.Unlock(), 1);
    second.join();
    EXPECT_EQ(semaphore.UserCount(), 0U);
  }
}

TEST(PosixSemaphore, ExcludesWhileFavouritesComeAndGo) {
  constexpr int kThreads = 3;
  constexpr int kBursts = 40;
  PosixSemaphore semaphore;
  int counter = 0;  // guarded by the semaphore
  int favours = 0;  // guarded by the semaphore
  std::vector<std::thread> threads;
  for (int i = 0; i < kThreads; ++i) {
    threads.emplace_back([&] {
      for (int burst = 0; burst < kBursts; ++burst) {
        for (int turn = 0; turn < 2000; ++turn) {
          semaphore.Lock();
          ++counter;
          favours += semaphore.HasFavourite() ? 1 : 0;
          EXPECT_EQ(semaphore.Unlock(), 1);
        }
        std::this_thread::yield();
      }
    });
  }
  for (std::thread& thread : threads) {
    thread.join();
  }
  EXPECT_EQ(counter, kThreads * kBursts * 2000);
  EXPECT_EQ(semaphore.UserCount(), 0U);
  RecordProperty("turns_by_favour", favours);
}

}  // namespace
