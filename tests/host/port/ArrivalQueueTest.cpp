// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <thread>

#include "host/port/ArrivalQueue.h"
#include "host/port/MonotonicTime.h"

namespace {

constexpr std::int64_t kLongNs = 20'000'000'000;

TEST(ArrivalQueue, KeepsOrderAndLeavesEmptyBlocksOut) {
  ArrivalQueue queue(1000);
  queue.Push({1, "ab"});
  queue.Push({2, ""});
  queue.Push({3, "c"});
  std::int64_t arrivedNs = 0;
  ArrivedBlock block;
  bool hasRoomAgain = false;
  ASSERT_TRUE(queue.Peek(&arrivedNs));
  EXPECT_EQ(arrivedNs, 1);
  ASSERT_TRUE(queue.Take(&block, &hasRoomAgain));
  EXPECT_EQ(block.bytes, "ab");
  ASSERT_TRUE(queue.Take(&block, &hasRoomAgain));
  EXPECT_EQ(block.bytes, "c");
  EXPECT_EQ(block.arrivedNs, 3);
  EXPECT_FALSE(queue.Take(&block, &hasRoomAgain));
  EXPECT_FALSE(queue.Peek(&arrivedNs));
}

TEST(ArrivalQueue, IsBoundedAndTellsOnceWhenThereIsRoomAgain) {
  constexpr std::size_t kLimit = 4096;
  ArrivalQueue queue(kLimit);
  std::size_t blocks = 0;
  while (!queue.IsFull()) {
    queue.Push({0, "x"});
    ++blocks;
  }
  // Single bytes count with what it takes to keep them.
  EXPECT_LT(blocks, kLimit);
  int tellings = 0;
  ArrivedBlock block;
  bool hasRoomAgain = false;
  for (std::size_t taken = 1; queue.Take(&block, &hasRoomAgain); ++taken) {
    if (hasRoomAgain) {
      ++tellings;
      // Half of them have been taken, the one that exceeded the limit included.
      EXPECT_GE(2 * taken, blocks);
      EXPECT_LE(2 * taken, blocks + 4);
    }
  }
  EXPECT_EQ(tellings, 1);
}

TEST(ArrivalQueue, PushEndsAWait) {
  ArrivalQueue queue(1000);
  EXPECT_FALSE(queue.WaitUntil(MonotonicNs() - 1));
  std::thread sender([&] { queue.Push({1, "a"}); });
  EXPECT_TRUE(queue.WaitUntil(MonotonicNs() + kLongNs));
  sender.join();
}

TEST(ArrivalQueue, WakeEndsAllWaitsFromThenOn) {
  ArrivalQueue queue(1000);
  std::thread waker([&] { queue.Wake(); });
  EXPECT_FALSE(queue.WaitUntil(MonotonicNs() + kLongNs));
  waker.join();
  EXPECT_FALSE(queue.WaitUntil(MonotonicNs() + kLongNs));
}

}  // namespace
