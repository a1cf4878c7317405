// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <string>

#include "driver/BlockAccess.h"
#include "driver/Protocol_LOKA.h"
#include "tests/unit/PlacedTag.h"

namespace {

class BlockAccessTest : public testing::Test {
 protected:
  BlockAccessTest() {
    EXPECT_NE(protocol_.Config("CfgVer=1 model=1 port=com1 baudrate=9600 parity=none bits=8 "
                               "stopbits=1 mode=RS-232"),
              0);
  }

  PlacedTag Tag(const char* uri, int index = 0, int subIndex = 0) {
    PlacedTag tag(uri, protocol_, index, subIndex);
    EXPECT_TRUE(tag.IsValid()) << uri;
    return tag;
  }

  Protocol_LOKA protocol_;
};

void ExpectAccess(const BlockAccess& access, long long index, long long items, long long skip,
                  long long bytes) {
  EXPECT_EQ(access.index, index);
  EXPECT_EQ(access.items, items);
  EXPECT_EQ(access.skip, skip);
  EXPECT_EQ(access.bytes, bytes);
}

}  // namespace

TEST_F(BlockAccessTest, ReadOfBytes) {
  const PlacedTag tag = Tag("0?rx_token?string-100");
  ExpectAccess(BlockAccess::ForRead(tag, 100), 0, 100, 0, 100);
  ExpectAccess(BlockAccess::ForRead(tag, 1), 0, 1, 0, 1);
  ExpectAccess(BlockAccess::ForRead(tag, 0), 0, 0, 0, 0);
  EXPECT_FALSE(BlockAccess::ForRead(tag, 1).isBitType);
  EXPECT_EQ(BlockAccess::ForRead(tag, 1).itemBytes, 1);
}

TEST_F(BlockAccessTest, ReadRoundsUpToWholeItems) {
  const PlacedTag tag = Tag("0?SP_Baud?unsignedInt");
  for (int length = 1; length <= 4; ++length) {
    ExpectAccess(BlockAccess::ForRead(tag, length), 0, 1, 0, 4);
  }
  ExpectAccess(BlockAccess::ForRead(tag, 5), 0, 2, 0, 8);
  ExpectAccess(BlockAccess::ForRead(tag, 0), 0, 0, 0, 0);
  EXPECT_EQ(BlockAccess::ForRead(tag, 4).itemBytes, 4);
}

TEST_F(BlockAccessTest, ReadSkipsToThePlaceWithinTheFirstItem) {
  ExpectAccess(BlockAccess::ForRead(Tag("0?rx_token?string-100", 0, 3), 10), 0, 13, 3, 13);
  ExpectAccess(BlockAccess::ForRead(Tag("0?rx_token?string-100", 5, 3), 10), 5, 13, 3, 13);
  ExpectAccess(BlockAccess::ForRead(Tag("0?SP_Baud?unsignedInt", 2, 1), 4), 2, 2, 4, 8);
}

TEST_F(BlockAccessTest, ReadOfBitsCountsEightItemsAByte) {
  ExpectAccess(BlockAccess::ForRead(Tag("0?connect?boolean"), 1), 0, 8, 0, 1);
  ExpectAccess(BlockAccess::ForRead(Tag("0?connect?boolean"), 3), 0, 24, 0, 3);
  EXPECT_TRUE(BlockAccess::ForRead(Tag("0?connect?boolean"), 1).isBitType);
}

TEST_F(BlockAccessTest, ReadOfBitsBeginsAtAWholeByte) {
  ExpectAccess(BlockAccess::ForRead(Tag("0?connect?boolean", 7), 1), 0, 8, 0, 1);
  ExpectAccess(BlockAccess::ForRead(Tag("0?connect?boolean", 17), 1), 16, 8, 0, 1);
  ExpectAccess(BlockAccess::ForRead(Tag("0?connect?boolean", -7), 1), 0, 8, 0, 1);
  ExpectAccess(BlockAccess::ForRead(Tag("0?connect?boolean", -9), 1), -8, 8, 0, 1);
}

TEST_F(BlockAccessTest, ReadOfTheLargestLengthDoesNotOverflow) {
  const int largest = 2147483647;
  ExpectAccess(BlockAccess::ForRead(Tag("0?rx_token?string-100"), largest), 0, largest, 0, largest);
  ExpectAccess(BlockAccess::ForRead(Tag("0?SP_Baud?unsignedInt"), largest), 0, 536870912, 0,
               2147483648LL);
  ExpectAccess(BlockAccess::ForRead(Tag("0?connect?boolean"), largest), 0, 17179869176LL, 0,
               largest);
}

TEST_F(BlockAccessTest, WriteCoversTheWholeValue) {
  ExpectAccess(BlockAccess::ForWrite(Tag("0?tx_token?string-100")), 0, 100, 0, 100);
  ExpectAccess(BlockAccess::ForWrite(Tag("0?SP_Baud?unsignedInt")), 0, 1, 0, 4);
  ExpectAccess(BlockAccess::ForWrite(Tag("0?SP_Bits?unsignedByte")), 0, 1, 0, 1);
  ExpectAccess(BlockAccess::ForWrite(Tag("0?tx_token?string-0")), 0, 0, 0, 0);
  ExpectAccess(BlockAccess::ForWrite(Tag("0?tx_token?string-2147483647")), 0, 2147483647, 0,
               2147483647);
}

TEST_F(BlockAccessTest, WriteSkipsToThePlaceWithinTheFirstItem) {
  ExpectAccess(BlockAccess::ForWrite(Tag("0?tx_token?string-10", 5, 3)), 5, 13, 3, 13);
  ExpectAccess(BlockAccess::ForWrite(Tag("0?SP_Baud?unsignedInt", 2, 1)), 2, 2, 4, 8);
}

TEST_F(BlockAccessTest, WriteOfBitsKeepsTheirPlace) {
  ExpectAccess(BlockAccess::ForWrite(Tag("0?connect?boolean")), 0, 1, 0, 1);
  ExpectAccess(BlockAccess::ForWrite(Tag("0?connect?boolean", 15)), 15, 1, 0, 1);
  EXPECT_TRUE(BlockAccess::ForWrite(Tag("0?connect?boolean")).isBitType);
}

TEST_F(BlockAccessTest, AdvancesByItems) {
  const BlockAccess access = BlockAccess::ForRead(Tag("0?SP_Baud?unsignedInt"), 4);
  EXPECT_EQ(access.Advance(0, 1), 4);
  EXPECT_EQ(access.Advance(7, 3), 12);
  EXPECT_EQ(access.Advance(0, 2147483647), 8589934588LL);
}

TEST_F(BlockAccessTest, AdvancesByWholeBytesOfBits) {
  const BlockAccess access = BlockAccess::ForRead(Tag("0?connect?boolean"), 1);
  for (int index = 0; index < 20; ++index) {
    for (int count = 0; count < 20; ++count) {
      EXPECT_EQ(access.Advance(index, count), (index % 8 + count) / 8) << index << " " << count;
    }
  }
}
