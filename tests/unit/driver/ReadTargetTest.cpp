// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <string>

#include "driver/ReadTarget.h"
#include "tests/support/GuardedBuffer.h"

namespace {

std::string Filled(std::size_t count) {
  return std::string(count, static_cast<char>(GuardedBuffer::kFill));
}

}  // namespace

TEST(ReadTargetTest, PutsValuesAtTheStart) {
  GuardedBuffer buffer(6);
  ReadTarget target(buffer.Data(), 6);
  target.PutInt32(0x01020304);
  EXPECT_EQ(buffer.Bytes(), "\x04\x03\x02\x01" + Filled(2));
  target.PutByte(0x1FF);
  EXPECT_EQ(buffer.Bytes(), "\xFF\x03\x02\x01" + Filled(2));
  target.PutText("ab");
  EXPECT_EQ(buffer.Bytes(), std::string("ab\0\x01", 4) + Filled(2));
}

TEST(ReadTargetTest, TextEndsAtItsFirstZero) {
  GuardedBuffer buffer(6);
  ReadTarget(buffer.Data(), 6).PutText(std::string("a\0b", 3));
  EXPECT_EQ(buffer.Bytes(), std::string("a\0", 2) + Filled(4));
}

TEST(ReadTargetTest, CutsWhatDoesNotFit) {
  for (std::size_t room = 0; room < 5; ++room) {
    GuardedBuffer buffer(room);
    ReadTarget target(buffer.Data(), room);
    target.PutText("HELLO");
    EXPECT_EQ(buffer.Bytes(), std::string("HELLO").substr(0, room));
    target.PutInt32(0x01020304);
    EXPECT_EQ(buffer.Bytes().substr(0, 4), std::string("\x04\x03\x02\x01").substr(0, room));
    EXPECT_TRUE(buffer.AreGuardsIntact());
  }
  GuardedBuffer nothing(0);
  ReadTarget(nothing.Data(), 0).PutByte(1);
  EXPECT_TRUE(nothing.IsUntouched());
}
