// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "model/MemoryType.h"

TEST(MemoryTypeTest, HasItsDefaults) {
  const MemoryType type;
  EXPECT_EQ(type.getName(), "");
  EXPECT_EQ(type.getNaturalType(), ICU_BOOLEAN);
  EXPECT_EQ(type.getVadoTypes(), 0x3fffff);
  EXPECT_FALSE(type.isReadOnly());
  EXPECT_FALSE(type.isWriteOnly());
  EXPECT_EQ(type.getMaxIndex(), 0);
  EXPECT_EQ(type.getBlockReadCount(), 0);
  EXPECT_EQ(type.getBlockWriteCount(), 0);
}

TEST(MemoryTypeTest, KeepsWhatIsSet) {
  MemoryType type;
  type.setName("area");
  type.setNaturalType(ICU_INT);
  type.setVadoTypes(0x40);
  type.setReadOnly(true);
  type.setWriteOnly(true);
  type.setMinIndex(3);
  type.setMaxIndex(7);
  type.setBlockReadCount(11);
  type.setBlockWriteCount(13);
  type.setSwap2(true);
  type.setSwap4(true);
  type.setSwap8(true);
  type.setBitWrite(true);
  type.setBitArrayWrite(true);
  type.setBitRead(true);
  type.setInDatagram(true);
  type.setInternalConversion(true);

  const MemoryType copy = type;
  type = MemoryType();
  EXPECT_EQ(copy.getName(), "area");
  EXPECT_EQ(copy.getNaturalType(), ICU_INT);
  EXPECT_EQ(copy.getVadoTypes(), 0x40);
  EXPECT_TRUE(copy.isReadOnly());
  EXPECT_TRUE(copy.isWriteOnly());
  EXPECT_EQ(copy.getMaxIndex(), 7);
  EXPECT_EQ(copy.getBlockReadCount(), 11);
  EXPECT_EQ(copy.getBlockWriteCount(), 13);
  EXPECT_EQ(type.getName(), "");
}
