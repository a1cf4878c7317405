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

// Asked until the clock has gone through some whole milliseconds, so that a stamp that is rounded
// up instead of cut would be seen ahead of the clock.
TEST(SystemClockTest, CountsWholeMillisecondsOfTheSystemClock) {
  constexpr unsigned long long kObservedMs = 3;
  const unsigned long long end = WallClockMs() + kObservedMs;
  unsigned long long after = 0;
  do {
    const unsigned long long before = WallClockMs();
    const unsigned long long stamp = currentTimeStamp();
    after = WallClockMs();
    ASSERT_GE(stamp, before);
    ASSERT_LE(stamp, after);
  } while (after < end);
}
