// SPDX-License-Identifier: Apache-2.0
// Identity, fixed answers and the error state: what the driver says without a line.
#include <array>
#include <climits>
#include <cstring>

#include "tests/plugin/PluginFixture.h"

namespace {

class BaseAnswersTest : public ProtocolFixture {
 protected:
  void SetUp() override {
    ProtocolFixture::SetUp();
    ASSERT_TRUE(P().Config(Mandatory()));
    tag_ = P().Tag("0?rx_token?string-10");
    ASSERT_NE(tag_, nullptr);
    host_.Log().Take();
  }
  void TearDown() override {
    // None of these operations has any business with the host.
    EXPECT_EQ(host_.Log().Take(), "");
    ProtocolFixture::TearDown();
  }

  // Runs `call` and returns what it left in the error state.
  template <class Call>
  std::string ErrorOf(Call call) {
    EXPECT_FALSE(P().Config("CfgVer=2"));  // some other error in front
    call();
    return P().Error();
  }

  ITag* tag_ = nullptr;
};

TEST_F(BaseAnswersTest, Identity) {
  EXPECT_STREQ(P()->GetImpName(), "Protocol_LOKA");
  EXPECT_EQ(P()->GetImpVersion(), 100);
  EXPECT_STREQ(P()->GetName(), "LOKA");
  EXPECT_STREQ(P()->GetNextInstanceName(), "LOKA");
  EXPECT_STREQ(P()->GetProtocolName(), "Loka Serial");
  EXPECT_EQ(P()->GetProtocolVersion(), 111);
  EXPECT_EQ(P()->GetProtocolType(), 471);
  EXPECT_EQ(P()->vcsGetCapability(), 2);
  for (const unsigned short n : std::array<unsigned short, 3>{0, 1, 65535}) {
    EXPECT_EQ(P()->vcsActivateInterleaved(n), 0);
  }
}

TEST_F(BaseAnswersTest, ConvertTo) {
  void* self = P()->ConvertTo("IProtocol");
  EXPECT_EQ(self, static_cast<void*>(P().Get()));
  for (const char* name : {"Protocol_LOKA", "ProtocolBase", "IProtocol7", "IProtocol6",
                           "IProtocol5", "IProtocol4", "IProtocol3", "IProtocol2"}) {
    EXPECT_EQ(P()->ConvertTo(name), self) << name;
  }
  for (const char* name : {"", "IProtocol1", "IProtocol8", "iprotocol", "IProtocol ", "Protocol",
                           "IInterface", "LOKA"}) {
    EXPECT_EQ(P()->ConvertTo(name), nullptr) << name;
  }
  EXPECT_EQ(P()->ConvertTo(nullptr), nullptr);
}

TEST_F(BaseAnswersTest, IdentIsTheNameUntilSet) {
  EXPECT_STREQ(P()->GetIdent(), "LOKA");
  P()->SetIdent("press 4");
  EXPECT_STREQ(P()->GetIdent(), "press 4");
  P()->SetIdent("");
  EXPECT_STREQ(P()->GetIdent(), "LOKA");
  std::string changing = "first";
  P()->SetIdent(changing.c_str());
  changing = "other";
  EXPECT_STREQ(P()->GetIdent(), "first");
}

TEST_F(BaseAnswersTest, NothingIsSupportedThatIsOptional) {
  const ITag* tags[] = {tag_, tag_};
  EXPECT_EQ(P()->MaxDatagramItems(tag_), 0);
  EXPECT_EQ(P()->MaxDatagramLength(tag_), 0);
  EXPECT_FALSE(P()->CanCoexistInDatagram(tag_, tag_));
  EXPECT_FALSE(P()->IsConverted());
  EXPECT_FALSE(P()->CanAddToDatagram(tags, 1, tag_));
  EXPECT_FALSE(P()->CanAddToDatagram(tags, 0, tag_));
  EXPECT_FALSE(P()->MultipleReadSupported());
  EXPECT_EQ(P()->MultipleRead(nullptr), 0);
  EXPECT_FALSE(P()->MultipleWriteSupported());
  EXPECT_EQ(P()->MultipleWrite(nullptr), 0);
  EXPECT_FALSE(P()->CanReadBitBlock(tag_));
  EXPECT_EQ(P()->GetInterface("IProtocol"), nullptr);
  EXPECT_EQ(P()->GetInterface(nullptr), nullptr);
  EXPECT_EQ(P()->MaxUnusedGap(tag_), 16777215);
  EXPECT_FALSE(P()->NeedsReadBeforeWrite(tag_));
  EXPECT_FALSE(P()->CanWriteDatagrams(tag_));
  EXPECT_FALSE(P()->CanAddToWriteDatagram(tags, 1, tag_));
  EXPECT_FALSE(P()->CanWriteBitBlock(tag_));
  EXPECT_FALSE(P()->hasPlcTimestamp(tag_));
  EXPECT_EQ(P().Error(), "1 ");
}

TEST_F(BaseAnswersTest, UnsupportedAccessTouchesNoBuffer) {
  const ITag* tags[] = {tag_, tag_};
  GuardedBuffer buffer(64);
  idal_error_t status[2] = {77, 78};
  unsigned long long stamps[2] = {5, 6};
  EXPECT_EQ(P()->ReadDatagram(tags, 2, buffer.Data()), 0);
  EXPECT_EQ(P()->ReadDatagramWithStatus(tags, 2, buffer.Data(), status), 0);
  EXPECT_EQ(P()->readDatagramWithTimestamp(tags, 2, buffer.Data(), status, stamps), 0);
  EXPECT_EQ(P()->ReadBitBlock(tag_, buffer.Data(), 8), 0);
  EXPECT_EQ(P()->readBitBlockWithTimestamp(tag_, buffer.Data(), 8, stamps), 0);
  EXPECT_EQ(P()->WriteDatagramWithStatus(tags, 2, buffer.Data(), status), 0);
  EXPECT_EQ(P()->WriteBitBlock(tag_, buffer.Data(), 8), 0);
  EXPECT_TRUE(buffer.IsUntouched());
  EXPECT_EQ(status[0], 77);
  EXPECT_EQ(status[1], 78);
  EXPECT_EQ(stamps[0], 5U);
  EXPECT_EQ(stamps[1], 6U);
  EXPECT_EQ(P().Error(), "1 ");
}

TEST_F(BaseAnswersTest, UnsupportedObjectsLeaveAReason) {
  const unsigned char bytes[4] = {};
  EXPECT_EQ(ErrorOf([&] { EXPECT_EQ(P()->WriteBlock(tag_, bytes, 4), 0); }),
            "-3 Optimized writing not supported");
  EXPECT_EQ(ErrorOf([&] { EXPECT_FALSE(P()->readObject(tag_, nullptr)); }),
            "-1 read object not supported");
  EXPECT_EQ(ErrorOf([&] { EXPECT_FALSE(P()->writeObject(tag_, nullptr)); }),
            "-1 write object not supported");
  const std::string noEvents = "-1 protocol does not support event channel";
  EXPECT_EQ(ErrorOf([&] { EXPECT_EQ(P()->createEventChannel(1), nullptr); }), noEvents);
  EXPECT_EQ(ErrorOf([&] {
              EXPECT_EQ(P()->createEventChannel(static_cast<IEventProcessor*>(nullptr)), nullptr);
            }),
            noEvents);
  EXPECT_EQ(ErrorOf([&] { EXPECT_EQ(P()->addEventSource(nullptr, "source"), 0); }), noEvents);
  EXPECT_EQ(ErrorOf([&] { EXPECT_EQ(P()->addAlarmEvents(nullptr, nullptr), 0); }), noEvents);
  EXPECT_EQ(ErrorOf([&] { EXPECT_EQ(P()->createAlarm("alarm"), nullptr); }),
            "-1 protocol does not support alarms");
  EXPECT_EQ(ErrorOf([&] { EXPECT_EQ(P()->createTrend("trend"), nullptr); }),
            "-1 protocol does not support trends");
}

TEST_F(BaseAnswersTest, TheOtherEventAlarmAndTrendOperationsSayNothing) {
  unsigned long long last = 9;
  P()->deleteEventChannel(nullptr);
  EXPECT_EQ(P()->frontEvent(nullptr), nullptr);
  P()->popEvent(nullptr);
  P()->deleteAlarm(nullptr);
  EXPECT_EQ(P()->listAlarms(nullptr), 0);
  EXPECT_EQ(P()->quitAlarm(nullptr), 0);
  P()->deleteTrend(nullptr);
  EXPECT_EQ(P()->readTrend(nullptr, 1, 2, last, 3, true, nullptr), 0);
  EXPECT_EQ(last, 9U);
  EXPECT_EQ(P().Error(), "1 ");
}

TEST_F(BaseAnswersTest, TheErrorStateStartsEmptyAndIsNeverCleared) {
  EXPECT_EQ(P()->GetLastError(), 1);
  EXPECT_STREQ(P()->GetLastErrorString(), "");
  P()->WriteBlock(tag_, nullptr, 0);
  EXPECT_EQ(P().Error(), "-3 Optimized writing not supported");
  P()->createAlarm("alarm");
  EXPECT_EQ(P().Error(), "-1 protocol does not support alarms");
  EXPECT_TRUE(P().Config(Mandatory()));
  EXPECT_EQ(P().Error(), "-1 protocol does not support alarms");
}

TEST_F(BaseAnswersTest, ExtendZeroAnswersFlagsByTheRecordsNumber) {
  struct Record {
    int number;
    unsigned char flags[4];
    unsigned char behind[4];
  };
  for (const int number : {3, 2, 4, 0, -1, INT_MAX}) {
    Record record = {number, {9, 9, 9, 9}, {8, 8, 8, 8}};
    EXPECT_EQ(P()->Extend(0, &record), 1);
    EXPECT_EQ(record.number, number);
    EXPECT_EQ(record.flags[0], number == 3 ? 1 : 0) << number;
    for (int i = 1; i < 4; ++i) EXPECT_EQ(record.flags[i], 0) << number;
    for (const unsigned char byte : record.behind) EXPECT_EQ(byte, 8);
  }
}

TEST_F(BaseAnswersTest, ExtendThreeAnswersOneByteOfTheRecord) {
  std::array<unsigned char, 69> record{};
  for (std::size_t i = 0; i < record.size(); ++i) record[i] = static_cast<unsigned char>(i);
  EXPECT_EQ(P()->Extend(3, record.data()), 68);
  record[68] = 0;
  EXPECT_EQ(P()->Extend(3, record.data()), 0);
  record[68] = 200;
  EXPECT_EQ(P()->Extend(3, record.data()), 200);
}

TEST_F(BaseAnswersTest, ExtendKnowsNoOtherCode) {
  std::array<unsigned char, 128> record{};
  record.fill(7);
  for (const int code : {1, 2, 4, 5, 100, -1, INT_MIN, INT_MAX}) {
    EXPECT_EQ(P()->Extend(code, record.data()), 0) << code;
  }
  for (const unsigned char byte : record) EXPECT_EQ(byte, 7);
}

class CanBeOptimizedTest : public ProtocolFixture {
 protected:
  void SetUp() override {
    ProtocolFixture::SetUp();
    ASSERT_TRUE(P().Config(Mandatory()));
  }
  bool Ask(const std::string& first, const std::string& second, bool forWrite = false) {
    const ITag* a = P().Tag(first);
    const ITag* b = P().Tag(second);
    EXPECT_NE(a, nullptr) << first;
    EXPECT_NE(b, nullptr) << second;
    return P()->CanBeOptimized(a, b, forWrite);
  }
};

TEST_F(CanBeOptimizedTest, WithinTheBlockReadCount) {
  EXPECT_TRUE(Ask("0?rx_token?string-10", "0?rx_token?string-20"));
  EXPECT_TRUE(Ask("0?tx_token?string-10", "0?tx_token?string-999999999"));
  EXPECT_FALSE(Ask("0?tx_token?string-10", "0?tx_token?string-1000000000"));
  EXPECT_TRUE(Ask("0?rx_token_len?unsignedInt", "0?rx_token_len?unsignedInt"));
  EXPECT_TRUE(Ask("0?SP_RxPrefix?string-1", "0?SP_RxPrefix?string-9999"));
  EXPECT_FALSE(Ask("0?SP_RxPrefix?string-1", "0?SP_RxPrefix?string-10000"));
}

TEST_F(CanBeOptimizedTest, NotWithoutABlockReadCount) {
  EXPECT_FALSE(Ask("0?tokens_available?unsignedInt", "0?tokens_available?unsignedInt"));
  EXPECT_FALSE(Ask("0?connect?boolean", "0?connect?boolean"));
  EXPECT_FALSE(Ask("0?SP_Bits?unsignedByte", "0?SP_Bits?unsignedByte"));
}

TEST_F(CanBeOptimizedTest, NotForWritingAndNotAcrossNodesOrTypes) {
  EXPECT_FALSE(Ask("0?rx_token?string-10", "0?rx_token?string-10", true));
  EXPECT_FALSE(Ask("0?rx_token?string-10", "1?rx_token?string-10"));
  EXPECT_FALSE(Ask("0?rx_token?string-10", "0?tx_token?string-10"));
  EXPECT_FALSE(Ask("0?SP_RxPrefix?string-10", "0?SP_RxSuffix?string-10"));
}

class ComParamsTest : public ProtocolFixture {};

TEST_F(ComParamsTest, BeforeAndAfterConfig) {
  EXPECT_EQ(P().ComParams(), ",0,none,0,0,RS-232");
  ASSERT_TRUE(
      P().Config("CfgVer=1 model=1 port=com2 baudrate=115200 parity=odd bits=7 stopbits=2 "
                 "mode=RS-485"));
  EXPECT_EQ(P().ComParams(), "com2,115200,odd,7,2,RS-485");
}

TEST_F(ComParamsTest, EveryParityAndModeOfTheConfiguration) {
  for (const char* parity : {"none", "even", "odd", "mark"}) {
    for (const char* mode : {"RS-232", "RS-485", "RS-422"}) {
      ASSERT_TRUE(P().Config(std::string("CfgVer=1 model=1 port=p baudrate=1 bits=2 stopbits=3 ") +
                             "parity=" + parity + " mode=" + mode));
      EXPECT_EQ(P().ComParams(), std::string("p,1,") + parity + ",2,3," + mode);
    }
  }
}

TEST_F(ComParamsTest, CodesThatOnlyRunTimeKnows) {
  const struct {
    int parity;
    int mode;
    const char* text;
  } cases[] = {{4, 3, "com1,9600,space,8,1,RS-485P"},
               {5, 4, "com1,9600,none,8,1,RS-232"},
               {-1, -1, "com1,9600,none,8,1,RS-232"}};
  for (const auto& example : cases) {
    ProtocolUnderTest protocol(plugin_);
    host_.Storage().Put("LOKA", "parity", example.parity);
    host_.Storage().Put("LOKA", "mode", example.mode);
    ASSERT_TRUE(protocol.Config(Mandatory("autoConnect=false")));
    ASSERT_NE(protocol->Start(), 0);
    EXPECT_EQ(protocol.ComParams(), example.text);
    protocol->Stop();
  }
}

TEST_F(ComParamsTest, ShortBuffersAreCutAndNotTerminated) {
  ASSERT_TRUE(P().Config(Mandatory()));
  const std::string text = "com1,9600,even,8,1,RS-232";
  for (int size = 0; size <= static_cast<int>(text.size()) + 2; ++size) {
    GuardedBuffer buffer(static_cast<std::size_t>(size));
    EXPECT_EQ(P()->vcsGetComParams(buffer.Chars(), size), 1) << size;
    EXPECT_TRUE(buffer.AreGuardsIntact()) << size;
    const std::string expected =
        (text + std::string(3, '\0')).substr(0, static_cast<std::size_t>(size));
    EXPECT_EQ(buffer.Bytes().substr(0, text.size() + 1), expected.substr(0, text.size() + 1));
  }
}

TEST_F(ComParamsTest, NoBufferOrANegativeSize) {
  ASSERT_TRUE(P().Config(Mandatory()));
  EXPECT_EQ(P()->vcsGetComParams(nullptr, 100), 0);
  EXPECT_EQ(P()->vcsGetComParams(nullptr, 0), 0);
  GuardedBuffer buffer(16);
  P()->vcsGetComParams(buffer.Chars(), -1);
  EXPECT_TRUE(buffer.IsUntouched());
  P()->vcsGetComParams(buffer.Chars(), INT_MIN);
  EXPECT_TRUE(buffer.IsUntouched());
}

}  // namespace
