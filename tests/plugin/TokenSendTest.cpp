// SPDX-License-Identifier: Apache-2.0
// Sending tokens, acknowledging them, and the general rules of writing.
#include "tests/plugin/PluginFixture.h"
#include "tests/support/HexDump.h"

namespace {

using std::string_literals::operator""s;

class TokenSendTest : public ProtocolFixture {
 protected:
  // The calls of one sent frame.
  static std::string Sent(const std::string& hex) {
    return "queue.Lock\nSend" + (hex.empty() ? "" : " " + hex) + "\nqueue.Unlock\n";
  }
};

TEST_F(TokenSendTest, FramesPlainTokens) {
  Run("tx_prefix=02 tx_suffix=03");
  EXPECT_TRUE(P().WriteText("tx_token", "ABC"));
  EXPECT_EQ(Calls(), Sent("02 41 42 43 03"));
  EXPECT_EQ(P().Error(), "1 ");
}

TEST_F(TokenSendTest, FramesHexTokens) {
  Run("tx_prefix=02 tx_suffix=03 hex_tokens=true");
  EXPECT_TRUE(P().WriteText("tx_token", "414243"));
  EXPECT_EQ(Calls(), Sent("02 41 42 43 03"));
  EXPECT_TRUE(P().WriteText("tx_token", "00fFaB"));
  EXPECT_EQ(Calls(), Sent("02 00 FF AB 03"));
  EXPECT_TRUE(P().WriteText("tx_token", "none"));
  EXPECT_EQ(Calls(), Sent("02 03"));
  EXPECT_TRUE(P().WriteText("tx_token", ""));
  EXPECT_EQ(Calls(), Sent("02 03"));
}

TEST_F(TokenSendTest, InHexModeTheTextMustBeHex) {
  Run("hex_tokens=true");
  for (const char* text : {"4", "4g", "ABC", "hello!", "4 ", "None"}) {
    P()->createAlarm("x");
    EXPECT_FALSE(P().WriteText("tx_token", text)) << text;
    EXPECT_EQ(P().Error(), "-1 token to send must be in hex format") << text;
    EXPECT_EQ(Calls(), "queue.Lock\nqueue.Unlock\n");
  }
}

TEST_F(TokenSendTest, InPlainModeHexTextIsText) {
  Run();
  EXPECT_TRUE(P().WriteText("tx_token", "4142"));
  EXPECT_EQ(Calls(), Sent("34 31 34 32"));
  EXPECT_TRUE(P().WriteText("tx_token", "none"));
  EXPECT_EQ(Calls(), Sent("6E 6F 6E 65"));
}

TEST_F(TokenSendTest, AnEmptyTokenIsSentAsItsFrame) {
  Run("tx_suffix=0D0A");
  EXPECT_TRUE(P().WriteText("tx_token", ""));
  EXPECT_EQ(Calls(), Sent("0D 0A"));
}

TEST_F(TokenSendTest, AnEmptyFrameIsStillSent) {
  Run("tx_prefix=none");
  EXPECT_TRUE(P().WriteText("tx_token", ""));
  EXPECT_EQ(Calls(), Sent(""));
}

TEST_F(TokenSendTest, ReceiveFramingPlaysNoPart) {
  Run("rx_prefix=02 rx_suffix=03");
  EXPECT_TRUE(P().WriteText("tx_token", "A"));
  EXPECT_EQ(Calls(), Sent("41"));
}

TEST_F(TokenSendTest, TheTextEndsAtAZeroOrAtTheTag) {
  Run();
  const ITag* tag = P().Tag("0?tx_token?string-6");
  EXPECT_TRUE(P().Write(tag, "AB\0CDE"s));
  EXPECT_EQ(Calls(), Sent("41 42"));
  EXPECT_TRUE(P().Write(tag, "ABCDEF"));
  EXPECT_EQ(Calls(), Sent("41 42 43 44 45 46"));
  EXPECT_TRUE(P().Write(tag, "\0BCDEF"s));
  EXPECT_EQ(Calls(), Sent(""));
}

TEST_F(TokenSendTest, EveryByteValueButZero) {
  Run();
  std::string text;
  for (int value = 1; value < 256; ++value) {
    text += static_cast<char>(static_cast<unsigned char>(value));
  }
  EXPECT_TRUE(P().WriteText("tx_token", text, 255));
  EXPECT_EQ(Calls(), Sent(HexDump(text)));
}

TEST_F(TokenSendTest, EveryByteValueInHexMode) {
  Run("hex_tokens=true");
  std::string text;
  std::string bytes;
  for (int value = 0; value < 256; ++value) {
    const char byte = static_cast<char>(static_cast<unsigned char>(value));
    text += HexDump(std::string(1, byte));
    bytes += byte;
  }
  EXPECT_TRUE(P().WriteText("tx_token", text, 600));
  EXPECT_EQ(Calls(), Sent(HexDump(bytes)));
}

TEST_F(TokenSendTest, LongTokens) {
  Run();
  for (const int length : {119, 120, 121, 127, 128, 129, 4096, 20000, 200000}) {
    const std::string text(static_cast<std::size_t>(length), 'a');
    EXPECT_TRUE(P().WriteText("tx_token", text, length)) << length;
    EXPECT_EQ(Calls(), Sent(HexDump(text))) << length;
  }
}

TEST_F(TokenSendTest, AFailingSendIsIgnored) {
  Run();
  host_.Faults().FailAlways("Send");
  EXPECT_TRUE(P().WriteText("tx_token", "A"));
  EXPECT_EQ(P().Error(), "1 ");
}

TEST_F(TokenSendTest, NotWhileDisconnected) {
  Run("autoConnect=false");
  EXPECT_FALSE(P().WriteText("tx_token", "A"));
  EXPECT_EQ(P().Error(), "-1 Serial port not active for sending");
  EXPECT_EQ(Calls(), "queue.Lock\nqueue.Unlock\n");
}

TEST_F(TokenSendTest, HexIsLookedAtBeforeTheConnection) {
  Run("autoConnect=false hex_tokens=true");
  EXPECT_FALSE(P().WriteText("tx_token", "4"));
  EXPECT_EQ(P().Error(), "-1 token to send must be in hex format");
  EXPECT_FALSE(P().WriteText("tx_token", "41"));
  EXPECT_EQ(P().Error(), "-1 Serial port not active for sending");
}

TEST_F(TokenSendTest, ATagWithoutLengthSendsNothing) {
  Run("tx_prefix=02");
  const ITag* tag = P().Tag("0?tx_token?string-");
  EXPECT_TRUE(P().Write(tag, ""));
  EXPECT_EQ(Calls(), "");
}

TEST_F(TokenSendTest, NothingBeforeStartOrAfterStop) {
  ASSERT_TRUE(P().Config(Mandatory()));
  EXPECT_FALSE(P().WriteText("tx_token", "A"));
  EXPECT_EQ(P().Error(), "-3 Protocol not started");
  ASSERT_NE(P()->Start(), 0);
  P()->Stop();
  Calls();
  EXPECT_FALSE(P().WriteText("tx_token", "A"));
  EXPECT_EQ(P().Error(), "-3 Protocol not started");
  EXPECT_EQ(Calls(), "");
}

class WriteRulesTest : public ProtocolFixture {};

TEST_F(WriteRulesTest, Acknowledge) {
  Run("rx_suffix=03");
  Receive(
      "A\x03"
      "B\x03");
  Calls();
  EXPECT_TRUE(P().WriteFlag("token_ack", 1));
  EXPECT_EQ(Calls(), "queue.Lock\nqueue.Unlock\n");
  EXPECT_EQ(P().ReadText("rx_token"), "B");
  EXPECT_TRUE(P().WriteFlag("token_ack", 0));
  EXPECT_EQ(P().ReadNumber("tokens_available"), 0U);
  EXPECT_TRUE(P().WriteFlag("token_ack", 1)) << "an empty queue is no failure";
  EXPECT_EQ(P().Error(), "1 ");
}

TEST_F(WriteRulesTest, ReadOnlyTypes) {
  Run("rx_suffix=03");
  Receive("A\x03");
  Calls();
  for (const char* uri : {"0?rx_token?string-4", "0?rx_token_len?unsignedInt",
                          "0?tokens_available?unsignedInt", "0?rx_token?string-2147483647"}) {
    const unsigned char value[4] = {};
    P()->WriteBlock(nullptr, nullptr, 0);
    EXPECT_EQ(P()->Write(P().Tag(uri), value), 0) << uri;
    EXPECT_EQ(P().Error(), "-1 writing to read_only type") << uri;
  }
  EXPECT_EQ(Calls(), "");
  EXPECT_EQ(P().ReadText("rx_token"), "A");
}

TEST_F(WriteRulesTest, TheEndOfAMemoryType) {
  Run();
  const unsigned char value[16] = {};
  for (const char* uri :
       {"0?SP_RxPrefix?string-10000", "0?SP_TxSuffix?string-20000", "0?tx_token?string-1000000000",
        "0?tx_token?string-2147483647", "0?SP_RxSuffix?string-2147483647"}) {
    P()->WriteBlock(nullptr, nullptr, 0);
    EXPECT_EQ(P()->Write(P().Tag(uri), value), 0) << uri;
    EXPECT_EQ(P().Error(), "-1 writing after the end of memory type") << uri;
  }
  EXPECT_EQ(Calls(), "");
  EXPECT_TRUE(P().WriteText("SP_RxPrefix", "02", 9999)) << "the last length that fits";
}

TEST_F(WriteRulesTest, TheOrderOfTheChecks) {
  ASSERT_TRUE(P().Config(Mandatory()));
  const unsigned char value[16] = {};
  EXPECT_EQ(P()->Write(P().Tag("0?rx_token?string-4"), value), 0);
  EXPECT_EQ(P().Error(), "-3 Protocol not started");
  ASSERT_NE(P()->Start(), 0);
  // The end comes before the conversion, the conversion before the memory type's own check.
  EXPECT_EQ(P()->Write(P().Tag("0?SP_RxPrefix?string-10000(nosuch)"), value), 0);
  EXPECT_EQ(P().Error(), "-1 writing after the end of memory type");
  EXPECT_EQ(P()->Write(P().Tag("0?SP_Baud?unsignedInt(nosuch)"), value), 0);
  EXPECT_EQ(P().Error(), "-9 write conversion error");
}

TEST_F(WriteRulesTest, AFailedConversionWritesNothing) {
  Run();
  EXPECT_FALSE(P().Write(P().Tag("0?tx_token?string-3(swap2)"), "ABC"));
  EXPECT_EQ(P().Error(), "-9 write conversion error");
  EXPECT_FALSE(P().Write(P().Tag("0?connect?boolean(bogus)"), std::string(1, '\0')));
  EXPECT_EQ(P().Error(), "-9 write conversion error");
  EXPECT_EQ(Calls(), "");
  EXPECT_TRUE(P().ReadFlag("connect"));
}

TEST_F(WriteRulesTest, WriteBlockIsNotSupported) {
  Run();
  const unsigned char value[4] = {'A', 'B', 0, 0};
  EXPECT_EQ(P()->WriteBlock(P().Tag("0?tx_token?string-4"), value, 4), 0);
  EXPECT_EQ(P().Error(), "-3 Optimized writing not supported");
  EXPECT_EQ(Calls(), "");
}

TEST_F(WriteRulesTest, ASuccessIsOne) {
  Run();
  const unsigned char value[4] = {'A', 0, 0, 0};
  EXPECT_EQ(P()->Write(P().Tag("0?tx_token?string-4"), value), 1);
}

}  // namespace
