// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "host/events/ClockWatch.h"

namespace {

constexpr std::int64_t kMinuteUs = 60000000;
constexpr const char* kBehind = " s; what is measured goes on, times of day do not";

TEST(ClockWatch, TimeThatPassesIsNoChange) {
  ClockWatch watch;
  EXPECT_EQ(watch.Look(1000 * kMinuteUs, 5 * kMinuteUs), "");
  EXPECT_EQ(watch.Look(1001 * kMinuteUs, 6 * kMinuteUs), "");
}

TEST(ClockWatch, TellsHowFarTheClockWasSet) {
  ClockWatch watch;
  (void)watch.Look(1000 * kMinuteUs, 5 * kMinuteUs);
  EXPECT_EQ(watch.Look(990 * kMinuteUs, 6 * kMinuteUs),
            std::string("the clock of this machine was set back by 660") + kBehind);
  EXPECT_EQ(watch.Look(991 * kMinuteUs, 7 * kMinuteUs), "");
  EXPECT_EQ(watch.Look(993 * kMinuteUs, 8 * kMinuteUs),
            std::string("the clock of this machine was set forward by 60") + kBehind);
}

TEST(ClockWatch, AClockThatIsKeptRightIsNotTold) {
  ClockWatch watch;
  std::int64_t bootUs = 0;
  for (std::int64_t dayUs = 1000 * kMinuteUs; dayUs < 1010 * kMinuteUs; dayUs += kMinuteUs) {
    EXPECT_EQ(watch.Look(dayUs, bootUs), "");
    bootUs += kMinuteUs - 900000;
  }
}

TEST(ClockWatch, OneSecondIsAStep) {
  ClockWatch back;
  (void)back.Look(kMinuteUs, 0);
  EXPECT_EQ(back.Look(kMinuteUs - 1000000, 0),
            std::string("the clock of this machine was set back by 1") + kBehind);
  ClockWatch slower;
  (void)slower.Look(kMinuteUs, 0);
  EXPECT_EQ(slower.Look(kMinuteUs - 999999, 0), "");
}

}  // namespace
