// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <algorithm>
#include <numeric>
#include <string>
#include <vector>

#include "protlib/SystemClock.h"
#include "tests/support/GuardedBuffer.h"
#include "tests/unit/FailingNew.h"
#include "tests/unit/FakeDriver.h"

namespace {

constexpr unsigned long long kNoStamp = 0xDEADBEEF;

// A driver that reads runs of bits.
class BitBlockDriver final : public FakeDriver {
 public:
  bool CanReadBitBlock(const ITag* /*tag*/) const override { return canReadBits; }
  int ReadBitBlock(const ITag* /*tag*/, unsigned char* buffer, int bitCount) override {
    lastBitCount = bitCount;
    if (!bitReadsSucceed) return 0;
    buffer[0] = 0x05;
    return 7;
  }
  bool canReadBits = true;
  bool bitReadsSucceed = true;
  int lastBitCount = -1;
};

// A driver that reads datagrams.
class ImageDriver final : public FakeDriver {
 public:
  int ReadDatagram(const ITag* const* /*tags*/, int /*count*/, unsigned char* buffer) override {
    buffer[0] = 0x77;
    return datagramResult;
  }
  int datagramResult = 1;
};

// The time stamp of a successful read lies between the clock before and behind it.
template <typename Read>
void ExpectStamped(Read read, int result) {
  unsigned long long stamp = kNoStamp;
  const unsigned long long before = currentTimeStamp();
  EXPECT_EQ(read(&stamp), result);
  const unsigned long long after = currentTimeStamp();
  EXPECT_GE(stamp, before);
  EXPECT_LE(stamp, after);
}

template <typename Read>
void ExpectNotStamped(Read read) {
  unsigned long long stamp = kNoStamp;
  EXPECT_EQ(read(&stamp), 0);
  EXPECT_EQ(stamp, kNoStamp);
}

}  // namespace

// --- Read ---

TEST(ProtocolBaseAccessTest, ReadsTheImageAndConvertsIt) {
  FakeDriver driver;
  driver.image = {0x12, 0x34};
  const FakeTag tag("unsignedShort(swap2)");
  Bytes value(2);
  EXPECT_NE(driver.Read(&tag, value.data()), 0);
  EXPECT_EQ(value, (Bytes{0x34, 0x12}));
  EXPECT_EQ(driver.lastReadBytes, 2);
}

TEST(ProtocolBaseAccessTest, ReadsABooleanAsABlockOfBytes) {
  FakeDriver driver;
  driver.image = {0x80, 0x02};
  FakeTag tag("boolean-3");
  tag.bitIndex = 7;
  Bytes value(3);
  EXPECT_NE(driver.Read(&tag, value.data()), 0);
  EXPECT_EQ(driver.lastReadBytes, 2);
  EXPECT_EQ(value, (Bytes{1, 0, 1}));
}

TEST(ProtocolBaseAccessTest, ReadsAllocateOnlyAbove64Bytes) {
  const auto allocations = [](int lengthBytes) {
    FakeDriver driver;
    std::iota(driver.image.begin(), driver.image.end(), static_cast<unsigned char>(1));
    FakeTag tag("string-1");
    tag.length = lengthBytes;
    GuardedBuffer value(static_cast<std::size_t>(lengthBytes));
    const long long before = FailingNew::Count();
    EXPECT_NE(driver.Read(&tag, value.Data()), 0);
    const long long count = FailingNew::Count() - before;
    EXPECT_EQ(value.Bytes(), std::string(driver.image.begin(), driver.image.begin() + lengthBytes));
    EXPECT_TRUE(value.AreGuardsIntact());
    return count;
  };
  EXPECT_EQ(allocations(0), 0);
  EXPECT_EQ(allocations(63), 0);
  EXPECT_EQ(allocations(64), 0);
  EXPECT_EQ(allocations(65), 1);
}

TEST(ProtocolBaseAccessTest, WorkBufferOfAReadIsZeroFilled) {
  class Shy final : public FakeDriver {
   public:
    int ReadBlock(const ITag* /*tag*/, unsigned char* /*buffer*/, int /*lengthBytes*/) override {
      return 1;  // and writes nothing
    }
  };
  Shy driver;
  for (const char* spec : {"string-64", "string-65"}) {
    const FakeTag tag(spec);
    Bytes value(65, 0x5A);
    EXPECT_NE(driver.Read(&tag, value.data()), 0);
    EXPECT_EQ(Bytes(value.begin(), value.begin() + tag.length),
              Bytes(static_cast<std::size_t>(tag.length), 0));
  }
}

TEST(ProtocolBaseAccessTest, FailedReadKeepsTheDriversReason) {
  FakeDriver driver;
  driver.readsSucceed = false;
  const FakeTag tag("int");
  GuardedBuffer value(4);
  EXPECT_EQ(driver.Read(&tag, value.Data()), 0);
  ExpectError(driver, -42, "device silent");
  EXPECT_TRUE(value.IsUntouched());
}

TEST(ProtocolBaseAccessTest, FailedConversionIsAReadError) {
  FakeDriver driver;
  const FakeTag tag("int(inv)");
  GuardedBuffer value(4);
  EXPECT_EQ(driver.Read(&tag, value.Data()), 0);
  ExpectError(driver, -9, "read conversion error");
  EXPECT_EQ(tag.GetErrorText(), "Conversion error at: inv");
  EXPECT_TRUE(value.IsUntouched());
}

TEST(ProtocolBaseAccessTest, ReadsThroughTheOverriddenConversion) {
  class Fixed final : public FakeTag {
   public:
    Fixed() : FakeTag("byte") {}
    bool ConvertVariable(const unsigned char* /*src*/, unsigned char* dst,
                         bool toDevice) const override {
      dst[0] = toDevice ? 1 : 2;
      return true;
    }
  };
  FakeDriver driver;
  const Fixed tag;
  Bytes value(1);
  EXPECT_NE(driver.Read(&tag, value.data()), 0);
  EXPECT_EQ(value, Bytes{2});
}

TEST(ProtocolBaseAccessTest, ReadWithoutTagOrBufferFails) {
  FakeDriver driver;
  const FakeTag tag("int");
  Bytes value(4);
  EXPECT_EQ(driver.Read(nullptr, value.data()), 0);
  EXPECT_EQ(driver.GetLastError(), -1);
  EXPECT_EQ(driver.Read(&tag, nullptr), 0);
  EXPECT_EQ(driver.blockReads, 0);
}

TEST(ProtocolBaseAccessTest, ReadOfANegativeLengthFails) {
  FakeDriver driver;
  FakeTag tag("string-1");
  tag.length = -5;
  GuardedBuffer value(4);
  EXPECT_EQ(driver.Read(&tag, value.Data()), 0);
  EXPECT_EQ(driver.GetLastError(), -1);
  EXPECT_EQ(driver.blockReads, 0);
  EXPECT_TRUE(value.IsUntouched());
}

TEST(ProtocolBaseAccessTest, ReadWithoutMemoryFails) {
  FakeDriver driver;
  const FakeTag tag("string-65");
  GuardedBuffer value(65);
  const FailingNew noMemory(1);
  EXPECT_EQ(driver.Read(&tag, value.Data()), 0);
  EXPECT_EQ(driver.GetLastError(), -1);
  EXPECT_EQ(driver.blockReads, 0);
}

TEST(ProtocolBaseAccessTest, DriverThatThrowsDoesNotReachTheHost) {
  class Throwing final : public FakeDriver {
   public:
    int ReadBlock(const ITag* /*tag*/, unsigned char* /*buffer*/, int /*lengthBytes*/) override {
      throw std::bad_alloc();
    }
  };
  Throwing driver;
  const FakeTag tag("int");
  Bytes value(4);
  EXPECT_EQ(driver.Read(&tag, value.data()), 0);
  ExpectError(driver, -1, "Out of memory");
}

// --- bit blocks ---

TEST(ProtocolBaseAccessTest, BitDriverReadsTheBitsOfABitTag) {
  BitBlockDriver driver;
  const FakeTag tag("boolean-3");
  Bytes value(3);
  EXPECT_NE(driver.Read(&tag, value.data()), 0);
  EXPECT_EQ(driver.lastBitCount, 3);
  EXPECT_EQ(driver.blockReads, 0);
  EXPECT_EQ(value, (Bytes{1, 0, 1}));
}

TEST(ProtocolBaseAccessTest, BitDriverReadsEightBitsAByteOfOtherTags) {
  BitBlockDriver driver;
  const FakeTag tag("int-3");
  Bytes value(12);
  EXPECT_NE(driver.Read(&tag, value.data()), 0);
  EXPECT_EQ(driver.lastBitCount, 96);
  EXPECT_EQ(value[0], 0x05);
}

TEST(ProtocolBaseAccessTest, BitReadThatFailsFailsTheRead) {
  BitBlockDriver driver;
  driver.bitReadsSucceed = false;
  const FakeTag tag("int");
  Bytes value(4);
  EXPECT_EQ(driver.Read(&tag, value.data()), 0);
  EXPECT_EQ(driver.GetLastError(), 1);
}

TEST(ProtocolBaseAccessTest, DriverThatSaysYesToBitsButReadsNoneFails) {
  class AllTalk final : public FakeDriver {
   public:
    bool CanReadBitBlock(const ITag* /*tag*/) const override { return true; }
  };
  AllTalk driver;
  const FakeTag tag("int");
  Bytes value(4);
  EXPECT_EQ(driver.Read(&tag, value.data()), 0);
  EXPECT_EQ(driver.blockReads, 0);
}

// --- time stamps ---

TEST(ProtocolBaseAccessTest, StampsSuccessfulReads) {
  FakeDriver driver;
  const FakeTag tag("int");
  Bytes value(4);
  ExpectStamped([&](auto* stamp) { return driver.readWithTimestamp(&tag, value.data(), stamp); },
                1);
  driver.readResult = 5;
  ExpectStamped(
      [&](auto* stamp) { return driver.readBlockWithTimestamp(&tag, value.data(), 4, stamp); }, 5);
  BitBlockDriver bits;
  ExpectStamped(
      [&](auto* stamp) { return bits.readBitBlockWithTimestamp(&tag, value.data(), 9, stamp); }, 7);
  EXPECT_EQ(bits.lastBitCount, 9);
}

TEST(ProtocolBaseAccessTest, FailedReadsLeaveTheStampAlone) {
  FakeDriver driver;
  driver.readsSucceed = false;
  const FakeTag tag("int");
  Bytes value(4);
  ExpectNotStamped(
      [&](auto* stamp) { return driver.readWithTimestamp(&tag, value.data(), stamp); });
  ExpectNotStamped(
      [&](auto* stamp) { return driver.readBlockWithTimestamp(&tag, value.data(), 4, stamp); });
  // Without bit blocks, too.
  ExpectNotStamped(
      [&](auto* stamp) { return driver.readBitBlockWithTimestamp(&tag, value.data(), 8, stamp); });
}

TEST(ProtocolBaseAccessTest, StampMayBeLeftOut) {
  FakeDriver driver;
  const FakeTag tag("int");
  Bytes value(4);
  EXPECT_EQ(driver.readWithTimestamp(&tag, value.data(), nullptr), 1);
}

TEST(ProtocolBaseAccessTest, StampedReadUsesTheDriversRead) {
  class OwnRead final : public FakeDriver {
   public:
    int Read(const ITag* /*tag*/, unsigned char* value) override {
      value[0] = 0x99;
      return 3;
    }
  };
  OwnRead driver;
  const FakeTag tag("byte");
  Bytes value(1);
  ExpectStamped([&](auto* stamp) { return driver.readWithTimestamp(&tag, value.data(), stamp); },
                3);
  EXPECT_EQ(value, Bytes{0x99});
}

TEST(ProtocolBaseAccessTest, BlockReadPassesItsLengthOn) {
  FakeDriver driver;
  const FakeTag tag("int");
  Bytes value(100);
  unsigned long long stamp = 0;
  EXPECT_EQ(driver.readBlockWithTimestamp(&tag, value.data(), 100, &stamp), 1);
  EXPECT_EQ(driver.lastReadBytes, 100);
}

// --- datagrams ---

TEST(ProtocolBaseAccessTest, ReadDatagramMarksEveryTag) {
  ImageDriver driver;
  driver.datagramResult = 6;
  const FakeTag tag("int");
  const ITag* const tags[] = {&tag, &tag, &tag};
  Bytes buffer(4);
  idal_error_t status[4] = {55, 55, 55, 55};
  EXPECT_EQ(driver.ReadDatagramWithStatus(tags, 3, buffer.data(), status), 6);
  EXPECT_EQ(status[0], 1);
  EXPECT_EQ(status[1], 1);
  EXPECT_EQ(status[2], 1);
  EXPECT_EQ(status[3], 55);
  EXPECT_EQ(buffer[0], 0x77);
}

TEST(ProtocolBaseAccessTest, FailedDatagramLeavesStatusAndStamps) {
  ImageDriver driver;
  driver.datagramResult = 0;
  const FakeTag tag("int");
  const ITag* const tags[] = {&tag};
  Bytes buffer(4);
  idal_error_t status[1] = {55};
  unsigned long long stamps[1] = {kNoStamp};
  EXPECT_EQ(driver.ReadDatagramWithStatus(tags, 1, buffer.data(), status), 0);
  EXPECT_EQ(driver.readDatagramWithTimestamp(tags, 1, buffer.data(), status, stamps), 0);
  EXPECT_EQ(status[0], 55);
  EXPECT_EQ(stamps[0], kNoStamp);
}

TEST(ProtocolBaseAccessTest, DriverWithoutDatagramsReadsNone) {
  FakeDriver driver;
  const FakeTag tag("int");
  const ITag* const tags[] = {&tag};
  Bytes buffer(4);
  idal_error_t status[1] = {55};
  unsigned long long stamps[1] = {kNoStamp};
  EXPECT_EQ(driver.readDatagramWithTimestamp(tags, 1, buffer.data(), status, stamps), 0);
  EXPECT_EQ(status[0], 55);
  EXPECT_EQ(stamps[0], kNoStamp);
}

// So many tags that asking the clock for each of them would take several of its milliseconds.
TEST(ProtocolBaseAccessTest, AllTagsOfADatagramGetOneStamp) {
  constexpr std::size_t kTags = 500000;
  ImageDriver driver;
  driver.datagramResult = 6;
  const FakeTag tag("int");
  const std::vector<const ITag*> tags(kTags, &tag);
  Bytes buffer(4);
  std::vector<idal_error_t> status(kTags + 1, 55);
  std::vector<unsigned long long> stamps(kTags + 1, kNoStamp);
  const unsigned long long before = currentTimeStamp();
  EXPECT_EQ(driver.readDatagramWithTimestamp(tags.data(), static_cast<int>(kTags), buffer.data(),
                                             status.data(), stamps.data()),
            1);
  const unsigned long long after = currentTimeStamp();
  EXPECT_GE(stamps[0], before);
  EXPECT_LE(stamps[0], after);
  const auto stampsEnd = stamps.end() - 1;
  EXPECT_EQ(std::count(stamps.begin(), stampsEnd, stamps[0]), static_cast<long>(kTags));
  EXPECT_EQ(stamps[kTags], kNoStamp);
  const auto statusEnd = status.end() - 1;
  EXPECT_EQ(std::count(status.begin(), statusEnd, 1), static_cast<long>(kTags));
  EXPECT_EQ(status[kTags], 55);
}

TEST(ProtocolBaseAccessTest, StampedDatagramUsesTheDriversStatus) {
  class OwnStatus final : public FakeDriver {
   public:
    int ReadDatagramWithStatus(const ITag* const* /*tags*/, int /*count*/,
                               unsigned char* /*buffer*/, idal_error_t* status) override {
      status[0] = 9;
      return 4;
    }
  };
  OwnStatus driver;
  const FakeTag tag("int");
  const ITag* const tags[] = {&tag};
  Bytes buffer(4);
  idal_error_t status[1] = {};
  unsigned long long stamps[1] = {0};
  EXPECT_EQ(driver.readDatagramWithTimestamp(tags, 1, buffer.data(), status, stamps), 1);
  EXPECT_EQ(status[0], 9);
  EXPECT_NE(stamps[0], 0U);
}

TEST(ProtocolBaseAccessTest, StatusAndStampsMayBeLeftOut) {
  ImageDriver driver;
  const FakeTag tag("int");
  const ITag* const tags[] = {&tag};
  Bytes buffer(4);
  EXPECT_EQ(driver.readDatagramWithTimestamp(tags, 1, buffer.data(), nullptr, nullptr), 1);
}
