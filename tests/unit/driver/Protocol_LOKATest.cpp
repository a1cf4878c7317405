// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <cstring>
#include <string>
#include <vector>

#include "driver/Protocol_LOKA.h"
#include "tests/support/GuardedBuffer.h"
#include "tests/unit/Bytes.h"
#include "tests/unit/HostInUse.h"
#include "tests/unit/PlacingProtocol.h"

namespace {

const std::string kDriverConfig =
    "CfgVer=1 model=1 port=com1 baudrate=9600 parity=even bits=8 stopbits=1 mode=RS-232 ";

class Protocol_LOKATest : public testing::Test {
 protected:
  void Start(const std::string& moreConfig = "") {
    ASSERT_NE(protocol_.Config((kDriverConfig + moreConfig).c_str()), 0)
        << protocol_.GetLastErrorString();
    ASSERT_NE(protocol_.Start(), 0) << protocol_.GetLastErrorString();
  }

  // A tag at a place of the memory type; owned by the protocol.
  ITag* Tag(const char* uri, int index = 0, int subIndex = 0) {
    protocol_.index = index;
    protocol_.subIndex = subIndex;
    ITag* const tag = protocol_.CreateTag(uri);
    EXPECT_NE(tag, nullptr) << uri;
    return tag;
  }

  int WriteText(const ITag* tag, const std::string& text) {
    Bytes value(static_cast<std::size_t>(tag->GetVarLength()) + 1);
    std::memcpy(value.data(), text.data(), text.size());
    return protocol_.Write(tag, value.data());
  }

  int WriteNumber(const ITag* tag, unsigned int number) {
    return protocol_.Write(tag, BytesOf(number).data());
  }

  int WriteByte(const ITag* tag, unsigned char byte) { return protocol_.Write(tag, &byte); }

  std::string ReadText(const char* uri) {
    Bytes value(1000);
    EXPECT_NE(protocol_.Read(Tag(uri), value.data()), 0) << protocol_.GetLastErrorString();
    return reinterpret_cast<const char*>(value.data());
  }

  int ReadNumber(const char* uri) {
    Bytes value(4);
    EXPECT_NE(protocol_.Read(Tag(uri), value.data()), 0) << protocol_.GetLastErrorString();
    return NumberIn<int>(value.data());
  }

  int ReadByte(const char* uri) {
    unsigned char value = 0;
    EXPECT_NE(protocol_.Read(Tag(uri), &value), 0) << protocol_.GetLastErrorString();
    return value;
  }

  void ExpectError(int code, const char* text) {
    EXPECT_EQ(protocol_.GetLastError(), code);
    EXPECT_STREQ(protocol_.GetLastErrorString(), text);
  }

  HostInUse host_;
  PlacingProtocol protocol_;
};

}  // namespace

// --- identity ---

TEST_F(Protocol_LOKATest, AnswersToItsNameAndThoseOfItsBase) {
  for (const char* name : {"Protocol_LOKA", "ProtocolBase", "IProtocol7", "IProtocol6",
                           "IProtocol5", "IProtocol4", "IProtocol3", "IProtocol2", "IProtocol"}) {
    EXPECT_EQ(protocol_.ConvertTo(name), &protocol_) << name;
  }
  for (const char* name : {"LOKA", "protocol_loka", "", "IProtocol8"}) {
    EXPECT_EQ(protocol_.ConvertTo(name), nullptr) << name;
  }
  EXPECT_EQ(protocol_.ConvertTo(nullptr), nullptr);
}

TEST_F(Protocol_LOKATest, FixedAnswers) {
  EXPECT_STREQ(protocol_.GetImpName(), "Protocol_LOKA");
  EXPECT_EQ(protocol_.GetImpVersion(), 100);
  EXPECT_STREQ(protocol_.GetName(), "LOKA");
  EXPECT_STREQ(protocol_.GetNextInstanceName(), "LOKA");
  EXPECT_STREQ(protocol_.GetProtocolName(), "Loka Serial");
  EXPECT_EQ(protocol_.GetProtocolVersion(), 111);
  EXPECT_EQ(protocol_.GetProtocolType(), 471);
  EXPECT_EQ(protocol_.GetMaxTm(nullptr), 0);
  EXPECT_EQ(protocol_.vcsGetCapability(), 2);
  EXPECT_EQ(protocol_.vcsActivateInterleaved(7), 0);
  EXPECT_EQ(protocol_.getTagUriFieldCount(), 3);
  EXPECT_STREQ(protocol_.tagUriNames()[0], "node");
  EXPECT_STREQ(protocol_.tagUriNames()[1], "memorytype");
  EXPECT_STREQ(protocol_.tagUriNames()[2], "datatype");
  EXPECT_EQ(protocol_.tagUriNames()[3], nullptr);
}

TEST_F(Protocol_LOKATest, ExtendCodeZeroSetsFlagsByKind) {
  for (const int kind : {-1, 0, 1, 2, 3, 4, 0x300, 0x01000003}) {
    GuardedBuffer record(8);
    std::memcpy(record.Data(), &kind, sizeof kind);
    EXPECT_EQ(protocol_.Extend(0, record.Data()), 1);
    EXPECT_EQ(NumberIn<int>(record.Data()), kind);
    EXPECT_EQ(record.Bytes().substr(4), std::string(kind == 3 ? "\x01\0\0\0" : "\0\0\0\0", 4))
        << kind;
    EXPECT_TRUE(record.AreGuardsIntact());
  }
}

TEST_F(Protocol_LOKATest, ExtendCodeThreeGivesAByteOfTheRecord) {
  for (const int value : {0, 1, 127, 128, 255}) {
    Bytes record(69, 0x5A);
    record[68] = static_cast<unsigned char>(value);
    EXPECT_EQ(protocol_.Extend(3, record.data()), value);
  }
}

TEST_F(Protocol_LOKATest, OtherExtensionsAreUnknown) {
  GuardedBuffer record(100);
  for (const int code : {-1, 1, 2, 4, 100}) {
    EXPECT_EQ(protocol_.Extend(code, record.Data()), 0);
    EXPECT_EQ(protocol_.Extend(code, nullptr), 0);
  }
  EXPECT_TRUE(record.IsUntouched());
  EXPECT_EQ(protocol_.GetLastError(), 1);
}

TEST_F(Protocol_LOKATest, ExtensionWithoutARecordFails) {
  EXPECT_EQ(protocol_.Extend(0, nullptr), 0);
  EXPECT_EQ(protocol_.GetLastError(), -1);
  EXPECT_EQ(protocol_.Extend(3, nullptr), 0);
}

// --- block reads of several tags ---

TEST_F(Protocol_LOKATest, TagsOfOneMemoryTypeShareABlock) {
  Start();
  const ITag* const first = Tag("0?rx_token?string-10");
  const ITag* const second = Tag("0?rx_token?string-20", 5);
  EXPECT_TRUE(protocol_.CanBeOptimized(first, second, false));
  EXPECT_TRUE(protocol_.CanBeOptimized(first, first, false));
  EXPECT_FALSE(protocol_.CanBeOptimized(second, first, false));  // begins in front of it
  EXPECT_FALSE(protocol_.CanBeOptimized(first, second, true));
}

TEST_F(Protocol_LOKATest, TagsOfOtherNodesOrTypesDoNot) {
  Start();
  const ITag* const first = Tag("0?rx_token?string-10");
  EXPECT_FALSE(protocol_.CanBeOptimized(first, Tag("1?rx_token?string-10"), false));
  EXPECT_FALSE(protocol_.CanBeOptimized(first, Tag("0?tx_token?string-10"), false));
  EXPECT_FALSE(protocol_.CanBeOptimized(nullptr, first, false));
  EXPECT_FALSE(protocol_.CanBeOptimized(first, nullptr, false));
}

TEST_F(Protocol_LOKATest, SpanHasToFitTheBlockReadCount) {
  Start();
  // 9999 items of a byte.
  const ITag* const first = Tag("0?SP_RxPrefix?string-10", 3);
  EXPECT_TRUE(protocol_.CanBeOptimized(first, Tag("0?SP_RxPrefix?string-9999", 3), false));
  EXPECT_FALSE(protocol_.CanBeOptimized(first, Tag("0?SP_RxPrefix?string-10000", 3), false));
  EXPECT_TRUE(protocol_.CanBeOptimized(first, Tag("0?SP_RxPrefix?string-9998", 4), false));
  EXPECT_FALSE(protocol_.CanBeOptimized(first, Tag("0?SP_RxPrefix?string-9999", 4), false));
}

TEST_F(Protocol_LOKATest, LengthsAreRoundedUpToItems) {
  Start();
  // 999999999 items of four bytes; one value is one item.
  const ITag* const first = Tag("0?rx_token_len?unsignedInt");
  EXPECT_TRUE(protocol_.CanBeOptimized(first, Tag("0?rx_token_len?unsignedInt", 999999998), false));
  EXPECT_FALSE(
      protocol_.CanBeOptimized(first, Tag("0?rx_token_len?unsignedInt", 999999999), false));
}

TEST_F(Protocol_LOKATest, WithoutBlockReadsNothingIsShared) {
  Start();
  for (const char* uri : {"0?connect?boolean", "0?SP_Baud?unsignedInt", "0?SP_Bits?unsignedByte",
                          "0?tokens_available?unsignedInt"}) {
    EXPECT_FALSE(protocol_.CanBeOptimized(Tag(uri), Tag(uri), false)) << uri;
  }
}

TEST_F(Protocol_LOKATest, SpansDoNotOverflow) {
  Start();
  const ITag* const first = Tag("0?rx_token?string-10", -2147483647 - 1);
  EXPECT_FALSE(
      protocol_.CanBeOptimized(first, Tag("0?rx_token?string-2147483647", 2147483647), false));
}

// --- reads at other places ---

TEST_F(Protocol_LOKATest, ReadSkipsToTheTagsPlace) {
  Start("rx_suffix=03");
  host_->Line().Feed("HELLO\x03");
  host_->RunUntilSilent();
  Bytes value(4, 0x5A);
  EXPECT_NE(protocol_.ReadBlock(Tag("0?rx_token?string-20", 0, 2), value.data(), 3), 0);
  EXPECT_EQ(std::string(value.begin(), value.end()), "LLO\x5A");
}

TEST_F(Protocol_LOKATest, ReadOfBitsRepeatsTheValueInEveryByte) {
  Start();
  Bytes value(4, 0x5A);
  EXPECT_NE(protocol_.ReadBlock(Tag("0?connect?boolean", 9), value.data(), 3), 0);
  EXPECT_EQ(value, (Bytes{1, 1, 1, 0x5A}));
}

TEST_F(Protocol_LOKATest, SerialParameterReadOneItemAtATimeRepeatsItsValue) {
  Start();
  Bytes value(4);
  EXPECT_NE(protocol_.ReadBlock(Tag("0?SP_Bits?unsignedByte"), value.data(), 4), 0);
  EXPECT_EQ(value, (Bytes{8, 8, 8, 8}));
}

// --- writes at other places: the rest of a covered item keeps its value ---

TEST_F(Protocol_LOKATest, WriteAtTheStartReadsNothing) {
  Start("rx_prefix=AABBCCDDEEFF");
  // Would fail if the running prefix were read: it is too long for the tag.
  EXPECT_NE(WriteText(Tag("0?SP_RxPrefix?string-4"), "01"), 0);
  EXPECT_EQ(ReadText("0?SP_RxPrefix?string-20"), "01");
}

TEST_F(Protocol_LOKATest, WriteBehindTheStartKeepsWhatIsInFront) {
  Start("rx_prefix=010203");
  // Ten items: they are read at once.
  EXPECT_NE(WriteText(Tag("0?SP_RxPrefix?string-8", 0, 2), "0D0A"), 0);
  EXPECT_EQ(ReadText("0?SP_RxPrefix?string-20"), "010D0A");
}

TEST_F(Protocol_LOKATest, WriteOfManyItemsReadsTheFirstOne) {
  Start("rx_prefix=0102030405");
  // Sixteen items: only the first one is read, which is the whole value here.
  EXPECT_NE(WriteText(Tag("0?SP_RxPrefix?string-12", 0, 4), "0D0A"), 0);
  EXPECT_EQ(ReadText("0?SP_RxPrefix?string-20"), "01020D0A");
}

TEST_F(Protocol_LOKATest, ReadThatFailsAbortsTheWrite) {
  Start("rx_prefix=0102030405");
  for (const char* uri : {"0?SP_RxPrefix?string-6", "0?SP_RxPrefix?string-9"}) {
    EXPECT_EQ(WriteText(Tag(uri, 0, 4), "0D"), 0) << uri;
    ExpectError(-1, "rx prefix too long to read");
  }
  EXPECT_EQ(ReadText("0?SP_RxPrefix?string-20"), "0102030405");
}

TEST_F(Protocol_LOKATest, FirstItemIsReadWithoutBlockReads) {
  Start();
  // Two items of a type that is read and written item by item: the first one keeps its value, so
  // that both are accepted.
  EXPECT_NE(WriteByte(Tag("0?SP_Bits?unsignedByte", -1, 1), 7), 0);
  EXPECT_EQ(ReadByte("0?SP_Bits?unsignedByte"), 7);
  EXPECT_NE(WriteNumber(Tag("0?SP_Baud?unsignedInt", -1, 1), 300), 0);
  EXPECT_EQ(ReadNumber("0?SP_Baud?unsignedInt"), 300);
}

TEST_F(Protocol_LOKATest, ItemThatIsRefusedEndsTheWrite) {
  Start();
  EXPECT_EQ(WriteNumber(Tag("0?SP_Baud?unsignedInt", -1, 1), 301), 0);
  ExpectError(-1, "illegal baudrate intValue");
}

TEST_F(Protocol_LOKATest, PartOfTheLastItemKeepsItsValue) {
  // A tag of two bytes in the second of two items.
  class HalfTag final : public PlacedTag {
   public:
    explicit HalfTag(const Protocol_LOKA& protocol)
        : PlacedTag("0?SP_Gap?unsignedInt", protocol, -1, 1) {}
    int PackedLen() const override { return 2; }
  };
  Start("gap=0x12345");
  const HalfTag tag(protocol_);
  EXPECT_NE(WriteNumber(&tag, 0x6789), 0);
  EXPECT_EQ(ReadNumber("0?SP_Gap?unsignedInt"), 0x16789);
}

TEST_F(Protocol_LOKATest, WriteBehindTheEndIsRefused) {
  Start();
  const auto expectRefusal = [this](const ITag* tag) {
    Bytes value(static_cast<std::size_t>(tag->GetVarLength()));
    EXPECT_EQ(protocol_.Write(tag, value.data()), 0);
    ExpectError(-1, "writing after the end of memory type");
    protocol_.Extend(0, nullptr);  // another error in between
  };
  expectRefusal(Tag("0?connect?boolean", 1));
  expectRefusal(Tag("0?connect?boolean", 9));
  expectRefusal(Tag("0?SP_Gap?unsignedInt", 1));
  expectRefusal(Tag("0?SP_Gap?unsignedInt", 0, 1));
  expectRefusal(Tag("0?SP_RxPrefix?string-10000"));
  expectRefusal(Tag("0?SP_RxPrefix?string-9999", 1));
}

TEST_F(Protocol_LOKATest, WriteUpToTheEndIsAccepted) {
  Start();
  EXPECT_NE(WriteText(Tag("0?SP_RxPrefix?string-9999"), "02"), 0);
  EXPECT_NE(WriteNumber(Tag("0?SP_Gap?unsignedInt"), 5), 0);
}

TEST_F(Protocol_LOKATest, WriteOfNoItemsDoesNothing) {
  Start();
  EXPECT_NE(WriteText(Tag("0?tx_token?string-0"), ""), 0);
  EXPECT_EQ(host_->Log().Count("Send"), 0);
}

TEST_F(Protocol_LOKATest, ConversionThatFailsWritesNothing) {
  Start();
  EXPECT_EQ(WriteNumber(Tag("0?SP_Gap?unsignedInt(neg)"), 5), 0);
  ExpectError(-9, "write conversion error");
  EXPECT_EQ(ReadNumber("0?SP_Gap?unsignedInt"), 0);
}

TEST_F(Protocol_LOKATest, ReadOnlyTypesAreNotWritten) {
  Start();
  EXPECT_EQ(WriteText(Tag("0?rx_token?string-9"), "x"), 0);
  ExpectError(-1, "writing to read_only type");
}

TEST_F(Protocol_LOKATest, NothingIsAccessedBeforeTheStart) {
  ASSERT_NE(protocol_.Config(kDriverConfig.c_str()), 0);
  Bytes value(16);
  EXPECT_EQ(protocol_.ReadBlock(Tag("0?connect?boolean"), value.data(), 1), 0);
  ExpectError(-3, "Protocol not started");
  protocol_.Extend(0, nullptr);
  EXPECT_EQ(protocol_.Write(Tag("0?rx_token?string-9"), value.data()), 0);
  ExpectError(-3, "Protocol not started");
  EXPECT_EQ(protocol_.Write(nullptr, nullptr), 0);
  ExpectError(-3, "Protocol not started");
}

TEST_F(Protocol_LOKATest, AccessWithoutTagOrBufferFails) {
  Start();
  GuardedBuffer value(4);
  const ITag* const tag = Tag("0?SP_Gap?unsignedInt");
  EXPECT_EQ(protocol_.ReadBlock(nullptr, value.Data(), 4), 0);
  EXPECT_EQ(protocol_.ReadBlock(tag, nullptr, 4), 0);
  EXPECT_EQ(protocol_.ReadBlock(tag, value.Data(), -1), 0);
  EXPECT_EQ(protocol_.Write(nullptr, value.Data()), 0);
  EXPECT_EQ(protocol_.Write(tag, nullptr), 0);
  EXPECT_EQ(protocol_.GetLastError(), -1);
  EXPECT_TRUE(value.IsUntouched());
}

TEST_F(Protocol_LOKATest, ReadOfNoBytesSucceeds) {
  Start();
  GuardedBuffer value(4);
  EXPECT_NE(protocol_.ReadBlock(Tag("0?SP_Gap?unsignedInt"), value.Data(), 0), 0);
  EXPECT_TRUE(value.IsUntouched());
}

TEST_F(Protocol_LOKATest, ApplyingNothingKeepsTheDataBitsAndThePort) {
  // The data bits fall back to the stop bits only where none were looked up; a start looks them up.
  Start();
  host_->Log().Take();
  EXPECT_NE(WriteByte(Tag("0?SP_Done?boolean"), 1), 0);
  EXPECT_EQ(host_->Log().Take(), "queue.Lock\nqueue.Unlock\n");
  EXPECT_EQ(ReadByte("0?SP_Bits?unsignedByte"), 8);
}

// --- a host that lacks services ---

TEST(Protocol_LOKAWithoutHostTest, DoesWhatItCan) {
  Protocol_LOKA protocol;
  ASSERT_NE(protocol.Config((kDriverConfig + "autoConnect=false").c_str()), 0);
  EXPECT_NE(protocol.Start(), 0);
  ITag* const tag = protocol.CreateTag("0?connect?boolean");
  ASSERT_NE(tag, nullptr);
  unsigned char value = 1;
  EXPECT_EQ(protocol.Write(tag, &value), 0);
  EXPECT_STREQ(protocol.GetLastErrorString(), "Can't open serial port");
  EXPECT_NE(protocol.Read(tag, &value), 0);
  EXPECT_EQ(value, 0);
  EXPECT_NE(protocol.Stop(), 0);
}

TEST(Protocol_LOKAWithoutHostTest, CannotOpenItsPort) {
  Protocol_LOKA protocol;
  ASSERT_NE(protocol.Config(kDriverConfig.c_str()), 0);
  EXPECT_EQ(protocol.Start(), 0);
  EXPECT_EQ(protocol.GetLastError(), -1);
  EXPECT_STREQ(protocol.GetLastErrorString(), "Can't open serial port");
}

TEST(Protocol_LOKAWithoutHostTest, ClosesItsPortWithoutSemaphores) {
  HostInUse host;
  piMultiTask = nullptr;
  Protocol_LOKA protocol;
  ASSERT_NE(protocol.Config(kDriverConfig.c_str()), 0);
  ASSERT_NE(protocol.Start(), 0);
  ITag* const tag = protocol.CreateTag("0?connect?boolean");
  ASSERT_NE(tag, nullptr);
  const unsigned char off = 0;
  EXPECT_NE(protocol.Write(tag, &off), 0);
  EXPECT_EQ(host->SerialFactory().OpenCount(), 0);
}

TEST(Protocol_LOKAWithoutHostTest, GivesEverythingBack) {
  HostInUse host;
  {
    Protocol_LOKA protocol;
    ASSERT_NE(protocol.Config(kDriverConfig.c_str()), 0);
    ASSERT_NE(protocol.Start(), 0);
    // Neither stopped nor closed.
  }
  EXPECT_EQ(host->Complaints(), "");
}
