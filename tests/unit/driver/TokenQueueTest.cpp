// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <new>
#include <string>
#include <vector>

#include "driver/TokenQueue.h"
#include "tests/unit/FailingNew.h"

namespace {

// Takes the queue apart, oldest token first.
std::vector<std::string> Drained(TokenQueue& queue) {
  std::vector<std::string> tokens;
  while (queue.Count() > 0) {
    EXPECT_EQ(queue.FrontLength(), static_cast<int>(queue.Front().size()));
    tokens.push_back(queue.Front());
    queue.PopFront();
  }
  return tokens;
}

using Texts = std::vector<std::string>;

}  // namespace

TEST(TokenQueueTest, StartsEmpty) {
  TokenQueue queue;
  EXPECT_EQ(queue.Count(), 0);
  EXPECT_EQ(queue.FrontLength(), 0);
  EXPECT_EQ(queue.Front(), "");
  queue.PopFront();
  queue.Clear();
  EXPECT_EQ(queue.Count(), 0);
}

TEST(TokenQueueTest, KeepsTheOrder) {
  TokenQueue queue;
  for (const char* token : {"a", "b", "c"}) queue.Push(token, 10);
  EXPECT_EQ(queue.Count(), 3);
  EXPECT_EQ(Drained(queue), (Texts{"a", "b", "c"}));
}

TEST(TokenQueueTest, FullQueueLosesItsOldestToken) {
  TokenQueue queue;
  for (const char* token : {"a", "b", "c", "d"}) queue.Push(token, 3);
  EXPECT_EQ(Drained(queue), (Texts{"b", "c", "d"}));
}

TEST(TokenQueueTest, CapacityOfZeroOrLessKeepsOneToken) {
  for (const int capacity : {1, 0, -1, -2147483647 - 1}) {
    TokenQueue queue;
    for (const char* token : {"a", "b", "c"}) {
      queue.Push(token, capacity);
      EXPECT_EQ(queue.Count(), 1) << capacity;
    }
    EXPECT_EQ(queue.Front(), "c") << capacity;
  }
}

TEST(TokenQueueTest, SmallerCapacityDropsOneTokenForEachNewOne) {
  TokenQueue queue;
  for (const char* token : {"a", "b", "c", "d"}) queue.Push(token, 10);
  queue.Push("e", 2);
  EXPECT_EQ(queue.Count(), 4);
  EXPECT_EQ(Drained(queue), (Texts{"b", "c", "d", "e"}));
}

TEST(TokenQueueTest, TokensMayHoldAnyBytes) {
  TokenQueue queue;
  const std::string token("a\0b", 3);
  queue.Push(token, 3);
  queue.Push("", 3);
  EXPECT_EQ(queue.FrontLength(), 3);
  EXPECT_EQ(Drained(queue), (Texts{token, ""}));
}

TEST(TokenQueueTest, ClearDropsEverything) {
  TokenQueue queue;
  queue.Push("a", 3);
  queue.Push("b", 3);
  queue.Clear();
  EXPECT_EQ(queue.Count(), 0);
  queue.Push("c", 3);
  EXPECT_EQ(Drained(queue), Texts{"c"});
}

TEST(TokenQueueTest, FailedPushChangesNothing) {
  TokenQueue queue;
  queue.Push("oldest", 3);
  // From some push on, the queue needs more memory.
  bool hasFailed = false;
  for (int i = 0; i < 2000 && !hasFailed; ++i) {
    const int before = queue.Count();
    const std::string token(static_cast<std::size_t>(i), 't');
    const FailingNew noMemory(1);
    try {
      queue.Push(token, before);
    } catch (const std::bad_alloc&) {
      hasFailed = true;
      EXPECT_EQ(queue.Count(), before);
    }
    EXPECT_EQ(noMemory.HasFailed(), hasFailed);
  }
  EXPECT_TRUE(hasFailed);
  EXPECT_EQ(queue.Count(), 1);
}

TEST(TokenQueueTest, FailedGrowthKeepsWhatIsThere) {
  TokenQueue queue;
  Texts expected;
  for (int i = 0; i < 1000; ++i) {
    const std::string token = std::to_string(i);
    const FailingNew noMemory(1);
    try {
      queue.Push(token, 2000);
    } catch (const std::bad_alloc&) {
      break;
    }
    expected.push_back(token);
  }
  EXPECT_LT(expected.size(), 1000U);
  queue.Push("next", 2000);
  expected.emplace_back("next");
  EXPECT_EQ(Drained(queue), expected);
}

TEST(TokenQueueTest, SteadyStreamOfShortTokensNeedsNoMemory) {
  TokenQueue queue;
  const std::string token(60, 't');
  for (int i = 0; i < 100; ++i) queue.Push(token, 8);
  const FailingNew noMemory(1);
  for (int i = 0; i < 100; ++i) {
    queue.Push(token, 8);
    queue.PopFront();
    queue.Push(token, 8);
  }
  EXPECT_FALSE(noMemory.HasFailed());
}

TEST(TokenQueueTest, HexTextTakesThePlaceOfWhatItsSlotHeld) {
  TokenQueue queue;
  for (int i = 0; i < 20; ++i) queue.Push("longer than the next", 1);
  for (int i = 0; i < 20; ++i) queue.PushHex(std::string("\0\xAF", 2), 4);
  EXPECT_EQ(Drained(queue), (Texts{"00AF", "00AF", "00AF", "00AF"}));
}
