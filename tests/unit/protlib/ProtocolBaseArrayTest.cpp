// SPDX-License-Identifier: Apache-2.0
// Single items of array tags, read and written through the whole array.
#include <gtest/gtest.h>

#include <string>

#include "tests/support/GuardedBuffer.h"
#include "tests/unit/FailingNew.h"
#include "tests/unit/FakeDriver.h"

namespace {

// Number of allocations of one access to the last item of an array of that many bytes.
template <typename Access>
long long Allocations(int lengthBytes, Access access) {
  class NoImage final : public FakeDriver {
   public:
    int Read(const ITag* /*tag*/, unsigned char* /*value*/) override { return 1; }
    int Write(const ITag* /*tag*/, const unsigned char* /*value*/) override { return 1; }
  };
  NoImage driver;
  FakeTag tag("byte-1");
  tag.length = lengthBytes;
  const long long before = FailingNew::Count();
  EXPECT_NE(access(driver, tag, lengthBytes - 1), 0);
  return FailingNew::Count() - before;
}

}  // namespace

TEST(ProtocolBaseArrayTest, ReadsOneItem) {
  FakeDriver driver;
  driver.image = {1, 0, 2, 0, 3, 0};
  const FakeTag tag("short-3");
  for (int index = 0; index < 3; ++index) {
    GuardedBuffer item(2);
    EXPECT_NE(driver.readArrayItem(&tag, index, item.Data()), 0);
    EXPECT_EQ(NumberIn<short>(item.Data()), index + 1);
    EXPECT_TRUE(item.AreGuardsIntact());
  }
}

TEST(ProtocolBaseArrayTest, ItemIsTakenFromTheConvertedValue) {
  FakeDriver driver;
  driver.image = {0, 1, 0, 2};
  const FakeTag tag("short-2(swap2)");
  Bytes item(2);
  EXPECT_NE(driver.readArrayItem(&tag, 1, item.data()), 0);
  EXPECT_EQ(item, (Bytes{2, 0}));
}

TEST(ProtocolBaseArrayTest, BitItemsAreBytes) {
  FakeDriver driver;
  driver.image = {0x02};
  const FakeTag tag("boolean-3");
  Bytes item(1, 9);
  EXPECT_NE(driver.readArrayItem(&tag, 1, item.data()), 0);
  EXPECT_EQ(item, Bytes{1});
  EXPECT_NE(driver.readArrayItem(&tag, 2, item.data()), 0);
  EXPECT_EQ(item, Bytes{0});
}

TEST(ProtocolBaseArrayTest, WritesOneItemAndTheOthersBack) {
  FakeDriver driver;
  driver.image = {1, 0, 2, 0, 3, 0};
  driver.writeResult = 8;
  const FakeTag tag("short-3");
  const Bytes item = {0xAA, 0xBB};
  EXPECT_EQ(driver.writeArrayItem(&tag, 1, item.data()), 8);
  EXPECT_EQ(driver.written, (Bytes{1, 0, 0xAA, 0xBB, 3, 0}));
}

TEST(ProtocolBaseArrayTest, ItemReadGivesTheResultOfRead) {
  class OwnRead final : public FakeDriver {
   public:
    int Read(const ITag* /*tag*/, unsigned char* value) override {
      value[1] = 0x99;
      return 3;
    }
  };
  OwnRead driver;
  const FakeTag tag("byte-2");
  Bytes item(1);
  EXPECT_EQ(driver.readArrayItem(&tag, 1, item.data()), 3);
  EXPECT_EQ(item, Bytes{0x99});
}

TEST(ProtocolBaseArrayTest, ItemWriteStartsFromTheDriversRead) {
  class OwnRead final : public FakeDriver {
   public:
    int Read(const ITag* /*tag*/, unsigned char* value) override {
      value[2] = 0x99;  // and leaves the rest as it is
      return 3;
    }
  };
  OwnRead driver;
  for (const int lengthBytes : {256, 257}) {
    FakeTag tag("byte-1");
    tag.length = lengthBytes;
    const unsigned char item = 0x11;
    EXPECT_EQ(driver.writeArrayItem(&tag, 0, &item), 1);
    Bytes expected(static_cast<std::size_t>(lengthBytes), 0);
    expected[0] = 0x11;
    expected[2] = 0x99;
    EXPECT_EQ(driver.written, expected) << lengthBytes;
  }
  EXPECT_EQ(driver.blockReads, 0);
}

// What is left behind the last whole item belongs to no item and is written back as it was.
TEST(ProtocolBaseArrayTest, IncompleteItemIsNone) {
  FakeDriver driver;
  driver.image = {1, 2, 3, 4, 5};
  FakeTag tag("short-2");
  tag.length = 5;
  Bytes item = {0xAA, 0xBB};
  EXPECT_EQ(driver.readArrayItem(&tag, 2, item.data()), 0);
  ExpectError(driver, -1, "accessing array item out of range");
  EXPECT_NE(driver.writeArrayItem(&tag, 1, item.data()), 0);
  EXPECT_EQ(driver.written, (Bytes{1, 2, 0xAA, 0xBB, 5}));
}

TEST(ProtocolBaseArrayTest, ScalarsHaveNoItems) {
  FakeDriver driver;
  const FakeTag tag("int");
  GuardedBuffer item(4);
  EXPECT_EQ(driver.readArrayItem(&tag, 0, item.Data()), 0);
  ExpectError(driver, -1, "accessing an array item where the tag is not array");
  driver.RecordError(-77, "x");
  EXPECT_EQ(driver.writeArrayItem(&tag, 0, item.Data()), 0);
  ExpectError(driver, -1, "accessing an array item where the tag is not array");
  EXPECT_TRUE(item.IsUntouched());
  EXPECT_EQ(driver.blockReads, 0);
}

TEST(ProtocolBaseArrayTest, ScalarIsSaidBeforeTheRange) {
  FakeDriver driver;
  const FakeTag tag("int");
  Bytes item(4);
  EXPECT_EQ(driver.readArrayItem(&tag, 99, item.data()), 0);
  ExpectError(driver, -1, "accessing an array item where the tag is not array");
}

TEST(ProtocolBaseArrayTest, ItemsOutsideTheArrayAreOutOfRange) {
  const FakeTag tag("short-3");
  for (const int index : {-1, 3, 4, 2147483647, -2147483647 - 1}) {
    FakeDriver driver;
    GuardedBuffer item(2);
    EXPECT_EQ(driver.readArrayItem(&tag, index, item.Data()), 0) << index;
    ExpectError(driver, -1, "accessing array item out of range");
    driver.RecordError(-77, "x");
    EXPECT_EQ(driver.writeArrayItem(&tag, index, item.Data()), 0) << index;
    ExpectError(driver, -1, "accessing array item out of range");
    EXPECT_TRUE(item.IsUntouched());
    EXPECT_TRUE(driver.written.empty());
  }
}

TEST(ProtocolBaseArrayTest, EmptyArrayHasNoItems) {
  FakeDriver driver;
  const FakeTag tag("short-0");
  Bytes item(2);
  EXPECT_EQ(driver.readArrayItem(&tag, 0, item.data()), 0);
  ExpectError(driver, -1, "accessing array item out of range");
}

TEST(ProtocolBaseArrayTest, FailedReadWritesNoItem) {
  FakeDriver driver;
  driver.readsSucceed = false;
  const FakeTag tag("short-3");
  GuardedBuffer item(2);
  EXPECT_EQ(driver.readArrayItem(&tag, 0, item.Data()), 0);
  EXPECT_TRUE(item.IsUntouched());
  EXPECT_EQ(driver.writeArrayItem(&tag, 0, item.Data()), 0);
  EXPECT_TRUE(driver.written.empty());
  ExpectError(driver, -42, "device silent");
}

TEST(ProtocolBaseArrayTest, FailedWriteFailsTheItem) {
  FakeDriver driver;
  driver.writeResult = 0;
  const FakeTag tag("short-3");
  const Bytes item(2);
  EXPECT_EQ(driver.writeArrayItem(&tag, 0, item.data()), 0);
}

TEST(ProtocolBaseArrayTest, ArrayBufferIsOnTheStackUpTo256Bytes) {
  const auto read = [](ProtocolBase& driver, const ITag& tag, int index) {
    unsigned char item = 0;
    return driver.readArrayItem(&tag, index, &item);
  };
  const auto write = [](ProtocolBase& driver, const ITag& tag, int index) {
    const unsigned char item = 0;
    return driver.writeArrayItem(&tag, index, &item);
  };
  EXPECT_EQ(Allocations(256, read), 0);
  EXPECT_EQ(Allocations(257, read), 1);
  EXPECT_EQ(Allocations(256, write), 0);
  EXPECT_EQ(Allocations(257, write), 1);
}

TEST(ProtocolBaseArrayTest, ArrayWithoutMemoryFails) {
  FakeDriver driver;
  const FakeTag tag("byte-257");
  Bytes item(1);
  const FailingNew noMemory(1);
  EXPECT_EQ(driver.readArrayItem(&tag, 0, item.data()), 0);
  EXPECT_EQ(driver.GetLastError(), -1);
  EXPECT_EQ(driver.blockReads, 0);
}

TEST(ProtocolBaseArrayTest, ArrayItemWithoutTagOrBufferFails) {
  FakeDriver driver;
  const FakeTag tag("byte-3");
  Bytes item(1);
  EXPECT_EQ(driver.readArrayItem(nullptr, 0, item.data()), 0);
  EXPECT_EQ(driver.readArrayItem(&tag, 0, nullptr), 0);
  EXPECT_EQ(driver.writeArrayItem(nullptr, 0, item.data()), 0);
  EXPECT_EQ(driver.writeArrayItem(&tag, 0, nullptr), 0);
  EXPECT_EQ(driver.GetLastError(), -1);
  EXPECT_EQ(driver.blockReads, 0);
  EXPECT_TRUE(driver.written.empty());
}
