// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "host/events/WallClock.h"

namespace {

TEST(WallClock, WritesUtcWithMicroseconds) {
  EXPECT_EQ(UtcText(0), "1970-01-01T00:00:00.000000Z");
  EXPECT_EQ(UtcText(1795252323123456), "2026-11-21T09:12:03.123456Z");
  EXPECT_EQ(UtcText(-1), "1969-12-31T23:59:59.999999Z");
}

TEST(WallClock, ReadsWhatItWrites) {
  for (const std::int64_t timeUs :
       {std::int64_t{0}, std::int64_t{-1}, std::int64_t{1795252323123456},
        std::int64_t{4102444800000000}}) {
    std::int64_t read = 1;
    EXPECT_TRUE(ParseUtcText(UtcText(timeUs), &read));
    EXPECT_EQ(read, timeUs);
  }
}

TEST(WallClock, RefusesEverythingElse) {
  std::int64_t read = 77;
  for (const char* const text :
       {"", "2026-11-21", "2026-11-21T09:12:03Z", "2026-11-21T09:12:03.123Z",
        "2026-13-21T09:12:03.123456Z", "2026-11-31T09:12:03.123456Z", "2026-11-21T09:12:03.123456",
        "2026-11-21T09:12:03.123456Z ", "+026-11-21T09:12:03.123456Z"}) {
    EXPECT_FALSE(ParseUtcText(text, &read)) << text;
  }
  EXPECT_EQ(read, 77);
}

}  // namespace
