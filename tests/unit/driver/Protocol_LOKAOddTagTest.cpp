// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <string>

#include "driver/Protocol_LOKA.h"
#include "driver/Tag_LOKA.h"
#include "driver/Texts_LOKA.h"
#include "tests/support/GuardedBuffer.h"
#include "tests/unit/HostInUse.h"

// Tags that contradict themselves: no URI leads to them, and reads and writes answer them all the
// same.

namespace {

class OddTag final : public Tag_LOKA {
 public:
  OddTag(const char* uri, const Protocol_LOKA& protocol) : Tag_LOKA(uri, protocol) {
    EXPECT_TRUE(IsValid()) << uri;
  }
  OddTag& SeenAs(MemoryTypeId id, bool isSerialParam) {
    id_ = id;
    isSerialParam_ = isSerialParam;
    return *this;
  }
  OddTag& OfType(ICU_Type type) {
    varType_ = type;
    return *this;
  }
  OddTag& At(int index, int subIndex) {
    index_ = index;
    subIndex_ = subIndex;
    return *this;
  }
};

class Protocol_LOKAOddTagTest : public testing::Test {
 protected:
  void SetUp() override {
    ASSERT_NE(protocol_.Config("CfgVer=1 model=1 port=com1 baudrate=9600 parity=even bits=8 "
                               "stopbits=1 mode=RS-232"),
              0);
    ASSERT_NE(protocol_.Start(), 0);
    host_->Log().Take();
  }
  void TearDown() override { protocol_.Stop(); }

  void ExpectError(const char* text) {
    EXPECT_EQ(protocol_.GetLastError(), -1);
    EXPECT_STREQ(protocol_.GetLastErrorString(), text);
  }

  HostInUse host_;
  Protocol_LOKA protocol_;
};

constexpr MemoryTypeId kSerialTypes[] = {
    MemoryTypeId::kBaud,     MemoryTypeId::kBits,      MemoryTypeId::kStop,
    MemoryTypeId::kParity,   MemoryTypeId::kMode,      MemoryTypeId::kRxPrefix,
    MemoryTypeId::kRxSuffix, MemoryTypeId::kGap,       MemoryTypeId::kTxPrefix,
    MemoryTypeId::kTxSuffix, MemoryTypeId::kHexTokens, MemoryTypeId::kTokenQueueSize,
    MemoryTypeId::kDone};

constexpr MemoryTypeId kTokenTypes[] = {MemoryTypeId::kTxToken,    MemoryTypeId::kRxToken,
                                        MemoryTypeId::kRxTokenLen, MemoryTypeId::kTokensAvailable,
                                        MemoryTypeId::kTokenAck,   MemoryTypeId::kConnect};

}  // namespace

TEST_F(Protocol_LOKAOddTagTest, SettingTakenForATokenTypeIsRefused) {
  OddTag tag("0?SP_Gap?unsignedInt", protocol_);
  const unsigned char value[4] = {1, 0, 0, 0};
  for (const MemoryTypeId id : kSerialTypes) {
    tag.SeenAs(id, false);
    GuardedBuffer buffer(4);
    EXPECT_EQ(protocol_.ReadBlock(&tag, buffer.Data(), 4), 0);
    ExpectError("illegal memtype to read");
    EXPECT_TRUE(buffer.IsUntouched());
    EXPECT_EQ(protocol_.Write(&tag, value), 0);
    ExpectError("illegal memtype to write");
    // The queue semaphore is given back both times.
    EXPECT_EQ(host_->Log().Take(), "queue.Lock\nqueue.Unlock\nqueue.Lock\nqueue.Unlock\n");
  }
}

TEST_F(Protocol_LOKAOddTagTest, LengthAndCountAreNotWritten) {
  OddTag tag("0?SP_Gap?unsignedInt", protocol_);
  const unsigned char value[4] = {1, 0, 0, 0};
  for (const MemoryTypeId id :
       {MemoryTypeId::kRxToken, MemoryTypeId::kRxTokenLen, MemoryTypeId::kTokensAvailable}) {
    tag.SeenAs(id, false);
    EXPECT_EQ(protocol_.Write(&tag, value), 0);
    ExpectError("illegal memtype to write");
    protocol_.Extend(0, nullptr);  // another error in between
  }
}

TEST_F(Protocol_LOKAOddTagTest, TokenTypeTakenForASettingDoesNothing) {
  OddTag tag("0?SP_Gap?unsignedInt", protocol_);
  const unsigned char value[4] = {1, 0, 0, 0};
  for (const MemoryTypeId id : kTokenTypes) {
    tag.SeenAs(id, true);
    GuardedBuffer buffer(4);
    EXPECT_NE(protocol_.ReadBlock(&tag, buffer.Data(), 4), 0);
    EXPECT_EQ(buffer.Bytes(), std::string(4, '\0'));
    EXPECT_NE(protocol_.Write(&tag, value), 0);
    EXPECT_EQ(host_->Log().Take(), "");
  }
  EXPECT_EQ(protocol_.GetLastError(), 1);
}

TEST_F(Protocol_LOKAOddTagTest, BitInAnAreaOfOtherTypesLiesInTheByteOfItsSubIndex) {
  OddTag tag("0?SP_Baud?unsignedInt", protocol_);
  tag.OfType(ICU_BOOLEAN).At(3, 21);
  EXPECT_EQ(tag.GetByteOffset(), 14U);  // 21 / 8 and 3 elements of 4 bytes
  EXPECT_EQ(tag.GetBitIndex(), 5);
  tag.At(0, 7);
  EXPECT_EQ(tag.GetByteOffset(), 0U);
  EXPECT_EQ(tag.GetBitIndex(), 7);
  tag.At(0, -9);
  EXPECT_EQ(tag.GetBitIndex(), -1);
}

// The texts of faults that the driver's own catalogue and records rule out.
TEST(Texts_LOKATest, FaultsOfTheDriver) {
  EXPECT_STREQ(Texts_LOKA::kNoCommonParams, "Can't access protocol common parameters");
  EXPECT_STREQ(Texts_LOKA::kNoNodeParams, "Can't access protocol node parameters");
  EXPECT_STREQ(Texts_LOKA::kNoModel, "Can't access model");
  EXPECT_STREQ(Texts_LOKA::kBadNaturalType, "invalid natural data type for this memory type");
}
