// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <string>

#include "protlib/BoundedCopy.h"
#include "tests/support/GuardedBuffer.h"

namespace {

// What a buffer of that size holds behind the copy.
std::string Copied(const char* text, int sizeBytes) {
  GuardedBuffer buffer(static_cast<std::size_t>(sizeBytes));
  BoundedCopy(buffer.Chars(), text, sizeBytes);
  EXPECT_TRUE(buffer.AreGuardsIntact()) << text << " into " << sizeBytes;
  return buffer.Bytes();
}

}  // namespace

TEST(BoundedCopyTest, ShortTextIsFollowedByZerosToTheEnd) {
  EXPECT_EQ(Copied("ab", 6), std::string("ab\0\0\0\0", 6));
  EXPECT_EQ(Copied("", 3), std::string(3, '\0'));
  EXPECT_EQ(Copied("ab", 3), std::string("ab\0", 3));
}

TEST(BoundedCopyTest, LongTextIsCutAndNotTerminated) {
  EXPECT_EQ(Copied("abc", 3), "abc");
  EXPECT_EQ(Copied("abcd", 3), "abc");
  EXPECT_EQ(Copied("abcd", 1), "a");
}

TEST(BoundedCopyTest, WithoutRoomNothingIsWritten) {
  GuardedBuffer buffer(4);
  BoundedCopy(buffer.Chars(), "abc", 0);
  BoundedCopy(buffer.Chars(), "abc", -1);
  BoundedCopy(buffer.Chars(), "abc", -2147483647 - 1);
  EXPECT_TRUE(buffer.IsUntouched());
  BoundedCopy(nullptr, "abc", 4);
}
