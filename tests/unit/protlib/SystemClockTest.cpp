// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <chrono>

#include "protlib/SystemClock.h"

namespace {

unsigned long long WallClockMs() {
  const auto now = std::chrono::system_clock::now().time_since_epoch();
  return static_cast<unsigned long long>(
      std::chrono::duration_cast<std::chrono::milliseconds>(now).count());
}

}  // namespace

TEST(SystemClockTest, CountsMillisecondsOfTheSystemClock) {
  const unsigned long long before = WallClockMs();
  const unsigned long long stamp = currentTimeStamp();
  const unsigned long long after = WallClockMs();
  EXPECT_GE(stamp, before);
  EXPECT_LE(stamp, after);
}
