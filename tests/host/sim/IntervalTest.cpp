// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "host/sim/Interval.h"

namespace {

using std::chrono::milliseconds;

constexpr Interval::Time IntervalAt(int ms) { return Interval::Time(milliseconds(ms)); }

TEST(Interval, HasNoPointsBeforeItBeginsAndWithoutAPeriod) {
  Interval interval(milliseconds(10));
  EXPECT_FALSE(interval.HasBegun());
  EXPECT_FALSE(interval.Next());
  EXPECT_FALSE(interval.Take(IntervalAt(1000)));
  Interval none(milliseconds(0));
  none.Begin(IntervalAt(0));
  EXPECT_FALSE(none.Next());
  EXPECT_FALSE(none.Take(IntervalAt(1000)));
}

TEST(Interval, DoesNotDriftHoweverLateItIsNoticed) {
  Interval interval(milliseconds(10));
  interval.Begin(IntervalAt(100));
  EXPECT_FALSE(interval.Take(IntervalAt(99)));
  for (int point = 100; point < 1000; point += 10) {
    EXPECT_EQ(interval.Next(), IntervalAt(point));
    EXPECT_TRUE(interval.Take(IntervalAt(point + 9)));
    EXPECT_FALSE(interval.Take(IntervalAt(point + 9)));
  }
  EXPECT_EQ(interval.Missed(), 0U);
}

TEST(Interval, LeavesOutAndCountsWhatWasMissed) {
  Interval interval(milliseconds(10));
  interval.Begin(IntervalAt(0));
  EXPECT_TRUE(interval.Take(IntervalAt(35)));
  EXPECT_EQ(interval.Missed(), 3U);
  EXPECT_EQ(interval.Next(), IntervalAt(40));
  EXPECT_TRUE(interval.Take(IntervalAt(40)));
  EXPECT_EQ(interval.Missed(), 3U);
}

}  // namespace
