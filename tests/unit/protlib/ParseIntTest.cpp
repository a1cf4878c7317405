// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <limits>

#include "protlib/ParseInt.h"

namespace {
constexpr int kLargest = std::numeric_limits<int>::max();
constexpr int kSmallest = std::numeric_limits<int>::min();
}  // namespace

TEST(ParseIntTest, ReadsLikeStrtol) {
  EXPECT_EQ(ParseInt("42", 10), 42);
  EXPECT_EQ(ParseInt("  \t-42rest", 10), -42);
  EXPECT_EQ(ParseInt("+7", 10), 7);
  EXPECT_EQ(ParseInt("ff", 16), 255);
  EXPECT_EQ(ParseInt("0x1F", 0), 31);
  EXPECT_EQ(ParseInt("017", 0), 15);
  EXPECT_EQ(ParseInt("", 0), 0);
  EXPECT_EQ(ParseInt("x", 0), 0);
  EXPECT_EQ(ParseInt("0x", 0), 0);
}

TEST(ParseIntTest, SaturatesAt32Bits) {
  EXPECT_EQ(ParseInt("2147483646", 10), kLargest - 1);
  EXPECT_EQ(ParseInt("2147483647", 10), kLargest);
  EXPECT_EQ(ParseInt("2147483648", 10), kLargest);
  EXPECT_EQ(ParseInt("4294967296", 10), kLargest);
  EXPECT_EQ(ParseInt("9223372036854775808", 10), kLargest);
  EXPECT_EQ(ParseInt("0xFFFFFFFF", 0), kLargest);
  EXPECT_EQ(ParseInt("-2147483647", 10), kSmallest + 1);
  EXPECT_EQ(ParseInt("-2147483648", 10), kSmallest);
  EXPECT_EQ(ParseInt("-2147483649", 10), kSmallest);
  EXPECT_EQ(ParseInt("-9223372036854775809", 10), kSmallest);
}

TEST(ParseIntTest, TellsWhereItStopped) {
  const char* const text = "12ab";
  const char* end = nullptr;
  EXPECT_EQ(ParseInt(text, 10, &end), 12);
  EXPECT_EQ(end, text + 2);
  EXPECT_EQ(ParseInt(text + 2, 10, &end), 0);
  EXPECT_EQ(end, text + 2);
}
