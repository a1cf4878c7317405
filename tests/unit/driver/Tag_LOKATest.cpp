// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <memory>
#include <string>

#include "driver/Protocol_LOKA.h"
#include "driver/Tag_LOKA.h"
#include "model/MemoryType.h"
#include "tests/unit/FailingNew.h"
#include "tests/unit/HostInUse.h"
#include "tests/unit/PlacedTag.h"

namespace {

const char* const kTagConfig =
    "CfgVer=1 model=1 port=com1 baudrate=9600 parity=none bits=8 stopbits=1 mode=RS-232 "
    "Node1::x=1 Node2::model=strange";

class Tag_LOKATest : public testing::Test {
 protected:
  Tag_LOKATest() { EXPECT_NE(protocol_.Config(kTagConfig), 0); }

  void ExpectRefused(const char* uri, const std::string& reason) {
    const Tag_LOKA tag(uri, protocol_);
    EXPECT_FALSE(tag.IsValid()) << uri;
    EXPECT_EQ(tag.GetErrorText(), reason) << uri;
    // The protocol records the same reason.
    EXPECT_EQ(protocol_.CreateTag(uri), nullptr) << uri;
    EXPECT_EQ(protocol_.GetLastError(), -1) << uri;
    EXPECT_EQ(protocol_.GetLastErrorString(),
              std::string("Tag URI error: ") + uri + " - " + reason);
  }

  void ExpectValid(const std::string& uri) {
    const Tag_LOKA tag(uri.c_str(), protocol_);
    EXPECT_TRUE(tag.IsValid()) << uri << ": " << tag.GetErrorText();
    EXPECT_EQ(tag.GetErrorText(), "");
    EXPECT_EQ(tag.GetVarName(), uri);
    EXPECT_EQ(tag.GetByteOffset(), 0U) << uri;
    EXPECT_EQ(tag.GetBitIndex(), 0) << uri;
    EXPECT_EQ(tag.Index(), 0) << uri;
  }

  int NodeOf(const std::string& uri) {
    const Tag_LOKA tag(uri.c_str(), protocol_);
    EXPECT_TRUE(tag.IsValid()) << uri << ": " << tag.GetErrorText();
    EXPECT_EQ(protocol_.GetNodeID(&tag), tag.NodeId());
    return tag.NodeId();
  }

  HostInUse host_;
  Protocol_LOKA protocol_;
};

}  // namespace

TEST_F(Tag_LOKATest, ExamplesAreValid) {
  for (const char* uri : {"0?tx_token?string-100", "0?rx_token?string-256",
                          "0?rx_token_len?unsignedInt", "0?tokens_available?unsignedInt",
                          "0?token_ack?boolean", "0?connect?boolean", "0?SP_Baud?unsignedInt",
                          "0?SP_Par?unsignedByte", "0?SP_RxPrefix?string-8", "?SP_Done?boolean"}) {
    ExpectValid(uri);
  }
}

TEST_F(Tag_LOKATest, StringTagHasItsTypeAndLength) {
  const Tag_LOKA tag("0?tx_token?string-100", protocol_);
  EXPECT_EQ(tag.GetVarType(), ICU_STRING);
  EXPECT_EQ(tag.GetVarLength(), 100);
  EXPECT_EQ(tag.GetItemType(), ICU_BYTE);
  EXPECT_EQ(tag.PackedLen(), 100);
  EXPECT_EQ(tag.Id(), MemoryTypeId::kTxToken);
  EXPECT_EQ(tag.GetMemoryType().getName(), "tx_token");
}

TEST_F(Tag_LOKATest, ScalarTagHasNoItemType) {
  const Tag_LOKA tag("0?SP_Baud?unsignedInt", protocol_);
  EXPECT_EQ(tag.GetVarType(), ICU_UNSIGNED_INT);
  EXPECT_EQ(tag.GetVarLength(), 4);
  EXPECT_EQ(tag.GetItemType(), ICU_NONE);
}

TEST_F(Tag_LOKATest, FieldsAreTrimmed) {
  ExpectValid(" 0 ?\tconnect ? boolean ");
  EXPECT_EQ(NodeOf("\t 7 ?connect?boolean"), 7);
}

// --- the node ---

TEST_F(Tag_LOKATest, NodeIsANumberInBaseZero) {
  EXPECT_EQ(NodeOf("1?connect?boolean"), 1);
  EXPECT_EQ(NodeOf("0x1?connect?boolean"), 1);
  EXPECT_EQ(NodeOf("010?connect?boolean"), 8);
  EXPECT_EQ(NodeOf("?connect?boolean"), 0);
  EXPECT_EQ(NodeOf("text?connect?boolean"), 0);
  EXPECT_EQ(NodeOf("5x?connect?boolean"), 5);
  EXPECT_EQ(NodeOf("-1?connect?boolean"), -1);
  EXPECT_EQ(NodeOf("99999999999?connect?boolean"), 2147483647);
}

TEST_F(Tag_LOKATest, UndeclaredNodeHasTheDefaultRecord) { ExpectValid("5?connect?boolean"); }

TEST_F(Tag_LOKATest, NodeOfAnUnknownModelHasNoMemoryTypes) {
  ExpectRefused("2?connect?boolean", "Can't access memory type");
}

TEST_F(Tag_LOKATest, NodeOfNoTagIsZero) { EXPECT_EQ(protocol_.GetNodeID(nullptr), 0); }

// --- refusals ---

TEST_F(Tag_LOKATest, ThereAreThreeFields) {
  for (const char* uri :
       {"", "0", "0?tx_token", "0?tx_token?string-10?x", "????", "0?connect?boolean?"}) {
    ExpectRefused(uri, "there must be 3 tag specification fields");
  }
}

TEST_F(Tag_LOKATest, NoUriIsAnEmptyOne) {
  const Tag_LOKA tag(nullptr, protocol_);
  EXPECT_FALSE(tag.IsValid());
  EXPECT_STREQ(tag.GetVarName(), "");
  EXPECT_EQ(tag.GetErrorText(), "there must be 3 tag specification fields");
}

TEST_F(Tag_LOKATest, MemoryTypeAndDataTypeAreMandatory) {
  ExpectRefused("0??boolean", "memorytype field missing");
  ExpectRefused("0? \t?boolean", "memorytype field missing");
  ExpectRefused("0??", "memorytype field missing");
  ExpectRefused("0?connect?", "vadoType field missing");
  ExpectRefused("0?connect? ", "vadoType field missing");
}

TEST_F(Tag_LOKATest, MemoryTypeIsCaseSensitive) {
  ExpectRefused("0?Connect?boolean", "Can't access memory type");
  ExpectRefused("0?connec?boolean", "Can't access memory type");
  ExpectRefused("0?sp_baud?unsignedInt", "Can't access memory type");
}

TEST_F(Tag_LOKATest, MemoryTypeIsCheckedBeforeTheDataType) {
  ExpectRefused("0?Connect?nonsense", "Can't access memory type");
}

TEST_F(Tag_LOKATest, UnknownDataTypeIsNamed) {
  ExpectRefused("0?tx_token?strin-10", "strin-10: data type unknown");
  ExpectRefused("0?connect? Boolean ", "Boolean: data type unknown");
  ExpectRefused("0?connect?boolean(inv", "boolean(inv: data type unknown");
}

TEST_F(Tag_LOKATest, DataTypeHasToSuitTheMemoryType) {
  for (const char* uri :
       {"0?connect?unsignedInt", "0?connect?boolean-1", "0?tx_token?binary-5", "0?tx_token?byte",
        "0?SP_Baud?int", "0?SP_Bits?byte", "0?SP_Bits?unsignedInt", "0?rx_token_len?object"}) {
    ExpectRefused(uri, "not allowed vado type");
  }
}

TEST_F(Tag_LOKATest, WithoutConfigurationThereIsNoMemoryType) {
  Protocol_LOKA unconfigured;
  const Tag_LOKA tag("0?connect?boolean", unconfigured);
  EXPECT_FALSE(tag.IsValid());
  EXPECT_EQ(tag.GetErrorText(), "Can't access memory type");
}

TEST_F(Tag_LOKATest, FieldsSetBeforeTheFailureStay) {
  const Tag_LOKA tag("7?connect?unsignedInt", protocol_);
  EXPECT_FALSE(tag.IsValid());
  EXPECT_EQ(tag.NodeId(), 7);
  EXPECT_EQ(tag.GetVarType(), ICU_UNSIGNED_INT);
}

TEST_F(Tag_LOKATest, InvalidTagHasNoAccessRights) {
  const Tag_LOKA tag("nonsense", protocol_);
  EXPECT_FALSE(tag.IsReadOnly());
  EXPECT_FALSE(tag.IsWriteOnly());
}

// --- what the memory type says ---

TEST_F(Tag_LOKATest, RightsAreTheMemoryTypes) {
  const auto rights = [this](const char* uri) {
    const Tag_LOKA tag(uri, protocol_);
    return std::string(tag.IsReadOnly() ? "r" : "-") + (tag.IsWriteOnly() ? "w" : "-");
  };
  EXPECT_EQ(rights("0?tx_token?string-9"), "-w");
  EXPECT_EQ(rights("0?token_ack?boolean"), "-w");
  EXPECT_EQ(rights("0?rx_token?string-9"), "r-");
  EXPECT_EQ(rights("0?rx_token_len?unsignedInt"), "r-");
  EXPECT_EQ(rights("0?tokens_available?unsignedInt"), "r-");
  EXPECT_EQ(rights("0?connect?boolean"), "--");
  EXPECT_EQ(rights("0?SP_Done?boolean"), "--");
}

TEST_F(Tag_LOKATest, EveryMemoryTypeCanBeNamed) {
  for (const MemoryTypeRow& row : kMemoryTypes) {
    std::string type = "boolean";
    if (row.vadoTypes == 0x10) type = "unsignedByte";
    if (row.vadoTypes == 0x40) type = "unsignedInt";
    if (row.vadoTypes == 0x200) type = "string-8";
    const Tag_LOKA tag(("0?" + std::string(row.name) + "?" + type).c_str(), protocol_);
    ASSERT_TRUE(tag.IsValid()) << row.name << ": " << tag.GetErrorText();
    EXPECT_EQ(tag.Id(), row.id) << row.name;
    EXPECT_EQ(tag.IsSerialParam(), std::string(row.name).substr(0, 3) == "SP_") << row.name;
  }
}

// --- conversions ---

TEST_F(Tag_LOKATest, ConversionsAreThoseOfTheDataType) {
  const Tag_LOKA tag("0?SP_Baud?unsignedInt(swap4)", protocol_);
  ASSERT_TRUE(tag.IsValid());
  const unsigned char src[4] = {1, 2, 3, 4};
  unsigned char dst[4] = {};
  EXPECT_TRUE(tag.ConvertVariable(src, dst, true));
  EXPECT_EQ(dst[0], 4);
  EXPECT_EQ(dst[3], 1);
}

TEST_F(Tag_LOKATest, UnknownConversionShowsAtTheFirstAccess) {
  const Tag_LOKA tag("0?SP_Baud?unsignedInt(wrong)", protocol_);
  ASSERT_TRUE(tag.IsValid());
  const unsigned char src[4] = {};
  unsigned char dst[4] = {};
  EXPECT_FALSE(tag.ConvertVariable(src, dst, true));
  EXPECT_EQ(tag.GetErrorText(), "Conversion error at: wrong");
}

// --- copies ---

TEST_F(Tag_LOKATest, CloneHasEverything) {
  const Tag_LOKA tag("0x3?SP_Gap?unsignedInt(swap4,inv)", protocol_);
  tag.SetError("text");
  const std::unique_ptr<ITag> clone(tag.Clone());
  ASSERT_NE(clone, nullptr);
  EXPECT_STREQ(clone->GetVarName(), tag.GetVarName());
  EXPECT_NE(clone->GetVarName(), tag.GetVarName());
  EXPECT_EQ(clone->GetVarType(), ICU_UNSIGNED_INT);
  EXPECT_EQ(clone->GetVarLength(), 4);
  EXPECT_EQ(clone->GetItemType(), ICU_NONE);
  EXPECT_EQ(protocol_.GetNodeID(clone.get()), 3);
  const auto& ours = static_cast<const Tag_LOKA&>(*clone);
  EXPECT_TRUE(ours.IsValid());
  EXPECT_TRUE(ours.IsSerialParam());
  EXPECT_EQ(ours.Id(), MemoryTypeId::kGap);
  EXPECT_EQ(&ours.GetMemoryType(), &tag.GetMemoryType());
  EXPECT_EQ(ours.GetErrorText(), "text");
  const unsigned char src[4] = {1, 2, 3, 4};
  unsigned char a[4] = {};
  unsigned char b[4] = {};
  EXPECT_TRUE(tag.ConvertVariable(src, a, true));
  EXPECT_TRUE(clone->ConvertVariable(src, b, true));
  EXPECT_EQ(std::string(a, a + 4), std::string(b, b + 4));
}

TEST_F(Tag_LOKATest, CloneOutlivesTheTag) {
  auto tag = std::make_unique<Tag_LOKA>("0?tx_token?string-100", protocol_);
  const std::unique_ptr<ITag> clone(tag->Clone());
  tag.reset();
  EXPECT_STREQ(clone->GetVarName(), "0?tx_token?string-100");
}

TEST_F(Tag_LOKATest, CloneOfAnInvalidTagIsInvalid) {
  const Tag_LOKA tag("nonsense", protocol_);
  const std::unique_ptr<ITag> clone(tag.Clone());
  EXPECT_FALSE(static_cast<const Tag_LOKA&>(*clone).IsValid());
}

TEST_F(Tag_LOKATest, CloneWithoutMemoryIsNull) {
  const Tag_LOKA tag("0?tx_token?string-100(swap2,swap4)", protocol_);
  for (int nth = 1;; ++nth) {
    const FailingNew noMemory(nth);
    const std::unique_ptr<ITag> clone(tag.Clone());
    if (!noMemory.HasFailed()) {
      EXPECT_NE(clone, nullptr);
      EXPECT_GT(nth, 2);
      break;
    }
    EXPECT_EQ(clone, nullptr) << nth;
  }
}

TEST_F(Tag_LOKATest, NoAllocationThatFailsLeavesHalfATag) {
  for (int nth = 1;; ++nth) {
    const FailingNew noMemory(nth);
    ITag* const tag = protocol_.CreateTag("0?tx_token?string-100(swap2,swap4)");
    if (!noMemory.HasFailed()) {
      EXPECT_NE(tag, nullptr);
      EXPECT_GT(nth, 5);
      break;
    }
    EXPECT_EQ(tag, nullptr) << nth;
    EXPECT_EQ(protocol_.GetLastError(), -1) << nth;
  }
}

// --- the place of a tag ---

TEST_F(Tag_LOKATest, ByteOffsetOfOtherTypesCountsBothIndexes) {
  const PlacedTag token("0?tx_token?string-5", protocol_, 7, 3);
  EXPECT_EQ(token.GetByteOffset(), 10U);  // 3 items of a byte and 7 elements of a byte
  const PlacedTag number("0?SP_Baud?unsignedInt", protocol_, 2, 3);
  EXPECT_EQ(number.GetByteOffset(), 20U);  // 3 x 4 and 2 x 4
}

TEST_F(Tag_LOKATest, PlaceOfABitInABitArea) {
  for (const int index : {0, 1, 7, 8, 9, 23}) {
    const PlacedTag tag("0?connect?boolean", protocol_, index, 5);
    EXPECT_EQ(tag.GetByteOffset(), static_cast<unsigned int>(index / 8)) << index;
    EXPECT_EQ(tag.GetBitIndex(), index % 8) << index;
  }
}

TEST_F(Tag_LOKATest, BitIndexHasTheSignOfTheIndex) {
  EXPECT_EQ(PlacedTag("0?connect?boolean", protocol_, -9, 5).GetBitIndex(), -1);
}

TEST_F(Tag_LOKATest, BitIndexInAnotherAreaIsThatOfTheSubIndex) {
  EXPECT_EQ(PlacedTag("0?SP_Baud?unsignedInt", protocol_, 3, 13).GetBitIndex(), 5);
}
