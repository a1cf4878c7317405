// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <new>
#include <stdexcept>

#include "protlib/NoThrow.h"

TEST(NoThrowTest, GivesTheResultOfTheBody) {
  EXPECT_EQ(NoThrow(0, [] { return 5; }), 5);
  EXPECT_TRUE(NoThrow(false, [] { return true; }));
}

TEST(NoThrowTest, TurnsAnExceptionIntoTheFailureResult) {
  EXPECT_EQ(NoThrow(-7, []() -> int { throw std::bad_alloc(); }), -7);
  EXPECT_EQ(NoThrow(-7, []() -> int { throw std::length_error("too long"); }), -7);
}

TEST(NoThrowTest, LetsAForcedUnwindPass) {
  struct NotAnError {};
  EXPECT_THROW(NoThrow(0, []() -> int { throw NotAnError(); }), NotAnError);
}
