// SPDX-License-Identifier: Apache-2.0
// The receive task: host calls of a pass, framing cases by name, and the token queue.
#include "tests/plugin/PluginFixture.h"

namespace {

using std::string_literals::operator""s;

class ReceiveTest : public ProtocolFixture {
 protected:
  // Lines of one received byte, or of a time-out.
  static std::string Byte(const std::string& hex, int timeoutMs = 500) {
    return "port.Lock\nReceive " + std::to_string(timeoutMs) + " -> " + hex + "\nport.Unlock\n";
  }
  static std::string TimeOut(int timeoutMs = 500) { return Byte("time-out", timeoutMs); }
};

TEST_F(ReceiveTest, HostCallsOfAToken) {
  Run("rx_prefix=02 rx_suffix=03");
  Receive("\x02\x41\x42\x03");
  EXPECT_EQ(Calls(), "IsToEnd -> 0\n" + Byte("02") + Byte("41") + Byte("42") + Byte("03") +
                         "queue.Lock\nqueue.Unlock\nSleep 0\nIsToEnd -> 0\n" + TimeOut() +
                         "Sleep 0\nIsToEnd -> 1\n");
  EXPECT_EQ(P().TakeTokens(), "[AB]");
}

TEST_F(ReceiveTest, HostCallsOfAGapToken) {
  Run("gap=20");
  Receive("AB");
  EXPECT_EQ(Calls(), "IsToEnd -> 0\n" + Byte("41", 20) + Byte("42", 20) + TimeOut(20) +
                         "queue.Lock\nqueue.Unlock\nSleep 0\nIsToEnd -> 1\n");
}

TEST_F(ReceiveTest, HostCallsWithAPrefixOnly) {
  Run("rx_prefix=02");
  Receive("\x02\x41\x02\x42");
  EXPECT_EQ(Calls(), "IsToEnd -> 0\n" + Byte("02") + Byte("41") + Byte("02") +
                         "queue.Lock\nqueue.Unlock\n" + Byte("42") + TimeOut() +
                         "queue.Lock\nqueue.Unlock\nSleep 0\nIsToEnd -> 1\n");
  EXPECT_EQ(P().TakeTokens(), "[A][B]");
}

TEST_F(ReceiveTest, SilenceTakesNoQueueSemaphore) {
  for (const char* framing : {"", "rx_prefix=02", "rx_suffix=03", "rx_prefix=02 rx_suffix=03"}) {
    ProtocolUnderTest protocol(plugin_);
    ASSERT_TRUE(protocol.Config(Mandatory(framing)));
    ASSERT_NE(protocol->Start(), 0);
    Calls();
    host_.RunPasses(1);
    const std::string calls = Calls();
    EXPECT_EQ(calls.find("queue"), std::string::npos) << framing << "\n" << calls;
    protocol->Stop();
  }
}

TEST_F(ReceiveTest, TheGapIsTheTimeOutOfEveryByte) {
  Run("gap=0 rx_suffix=03");
  Receive("A");
  EXPECT_NE(Calls().find("Receive 500 -> time-out"), std::string::npos);
  P()->Stop();

  ProtocolUnderTest other(plugin_);
  ASSERT_TRUE(other.Config(Mandatory("gap=7 port=x rx_prefix=02")));
  ASSERT_NE(other->Start(), 0);
  Calls();
  host_.Line().Feed("\x02\x41");
  host_.RunUntilSilent();
  const std::string calls = Calls();
  EXPECT_EQ(calls.find("Receive 500"), std::string::npos);
  EXPECT_NE(calls.find("Receive 7 -> 02"), std::string::npos) << calls;
  other->Stop();
}

TEST_F(ReceiveTest, APauseShorterThanTheGapIsWithinAToken) {
  Run();
  host_.Line().Feed("AB");
  host_.Line().Silence(499);
  host_.Line().Feed("CD");
  host_.Line().Silence(500);
  host_.Line().Feed("EF");
  host_.RunUntilSilent();
  EXPECT_EQ(P().TakeTokens(), "[ABCD][EF]");
}

TEST_F(ReceiveTest, PrefixAndSuffix) {
  Run("rx_prefix=02 rx_suffix=03");
  Receive("x\x02\x41\x42\x03yz\x02\x03\x02\x43\x03");
  EXPECT_EQ(P().TakeTokens(), "[AB][][C]");
}

TEST_F(ReceiveTest, SilenceDropsATokenWithoutItsSuffix) {
  Run("rx_prefix=02 rx_suffix=03");
  host_.Line().Feed("\x02\x41");
  host_.Line().Silence(500);
  host_.Line().Feed("\x42\x03\x02\x43\x03");
  host_.RunUntilSilent();
  EXPECT_EQ(P().TakeTokens(), "[C]");
}

TEST_F(ReceiveTest, SilenceDropsAPartOfAPrefix) {
  Run("rx_prefix=0205 rx_suffix=03");
  host_.Line().Feed("\x02");
  host_.Line().Silence(500);
  host_.Line().Feed("\x05\x41\x03");
  host_.RunUntilSilent();
  EXPECT_EQ(P().TakeTokens(), "");
}

TEST_F(ReceiveTest, AMismatchRestartsThePrefixAtItsByte) {
  Run("rx_prefix=0202 rx_suffix=03");
  Receive("\x02\x05\x02\x02\x41\x03");
  EXPECT_EQ(P().TakeTokens(), "[A]");
}

// There is no going back behind the mismatching byte: in 02 02 05 the prefix 02 05 is found, in
// 02 03 02 03 05 the prefix 02 03 05 is found from the second 02 on, but 02 02 03 hides 02 02 02
// 03.
TEST_F(ReceiveTest, NoFurtherBackTracking) {
  Run("rx_prefix=0205 rx_suffix=03");
  Receive("\x02\x02\x05\x41\x03");
  EXPECT_EQ(P().TakeTokens(), "[A]");
  P()->Stop();

  ProtocolUnderTest other(plugin_);
  ASSERT_TRUE(other.Config(Mandatory("rx_prefix=020203 rx_suffix=04")));
  ASSERT_NE(other->Start(), 0);
  host_.Line().Feed("\x02\x02\x02\x03\x41\x04");
  host_.RunUntilSilent();
  EXPECT_EQ(other.TakeTokens(), "") << "the third 02 counts as the first of a new match";
  other->Stop();
}

TEST_F(ReceiveTest, PrefixOnly) {
  Run("rx_prefix=02");
  Receive("x\x02\x41\x02\x42");
  EXPECT_EQ(P().TakeTokens(), "[A][B]");
  Receive("\x02\x02");
  EXPECT_EQ(P().TakeTokens(), "[]");
  Receive("\x02");
  EXPECT_EQ(P().TakeTokens(), "");
}

TEST_F(ReceiveTest, PrefixOnlyWithOverlap) {
  Run("rx_prefix=0202");
  Receive("\x02\x02\x02");
  EXPECT_EQ(P().TakeTokens(), "[]");
  Receive("\x02\x02\x41\x02\x02\x02\x42");
  EXPECT_EQ(P().TakeTokens(), "[A][][B]");
}

TEST_F(ReceiveTest, SuffixOnly) {
  Run("rx_suffix=0D0A");
  Receive("AB\r\n\r\nC\rD\r\r\n\nE");
  EXPECT_EQ(P().TakeTokens(), "[AB][][C\rD\r]");
}

TEST_F(ReceiveTest, APrefixDoesNotLendBytesToTheSuffix) {
  Run("rx_prefix=0203 rx_suffix=03");
  Receive("\x02\x03\x41\x03");
  EXPECT_EQ(P().TakeTokens(), "[A]");
  P()->Stop();
  ProtocolUnderTest other(plugin_);
  ASSERT_TRUE(other.Config(Mandatory("rx_prefix=0203 rx_suffix=0303")));
  ASSERT_NE(other->Start(), 0);
  host_.Line().Feed("\x02\x03\x03\x41\x03\x03");
  host_.RunUntilSilent();
  EXPECT_EQ(other.TakeTokens(), "[\x03\x41]");
  other->Stop();
}

TEST_F(ReceiveTest, NeitherPrefixNorSuffix) {
  Run();
  host_.Line().Silence(5000);
  host_.Line().Feed("A");
  host_.Line().Silence(500);
  host_.Line().Feed("\x02\x03");
  host_.RunUntilSilent();
  EXPECT_EQ(P().TakeTokens(), "[A][\x02\x03]");
}

TEST_F(ReceiveTest, TheWordNoneIsAnEmptyFrame) {
  Run("rx_prefix=none rx_suffix=none");
  Receive("none");
  EXPECT_EQ(P().TakeTokens(), "[none]");
}

TEST_F(ReceiveTest, FramingTextsOfEitherCase) {
  Run("rx_prefix=aB rx_suffix=Cd");
  Receive("\xAB\x41\xCD");
  EXPECT_EQ(P().TakeTokens(), "[A]");
}

TEST_F(ReceiveTest, EveryByteValueGetsThrough) {
  Run("rx_prefix=02 hex_tokens=true");
  std::string line = "\x02";
  std::string hex;
  for (int value = 0; value < 256; ++value) {
    if (value == 2) continue;
    line += static_cast<char>(static_cast<unsigned char>(value));
    const char digits[] = "0123456789ABCDEF";
    hex += digits[value / 16];
    hex += digits[value % 16];
  }
  Receive(line);
  EXPECT_EQ(P().TakeTokens(), "[" + hex + "]");
}

TEST_F(ReceiveTest, FramesOfHighBytes) {
  Run("rx_prefix=FF80 rx_suffix=00");
  Receive("\xFF\x80\x7F\xFE\x00"s);
  EXPECT_EQ(P().TakeTokens(), "[\x7F\xFE]");
}

TEST_F(ReceiveTest, HexTokensAreUpperCaseText) {
  Run("rx_prefix=02 rx_suffix=03 hex_tokens=true");
  Receive("\x02\x41\x42\x03\x02\xAB\x00\x9F\x03\x02\x03"s);
  EXPECT_EQ(P().TakeTokens(), "[4142][AB009F][]");
}

// With 1000 bytes in the buffer the framing may still complete; with 1001 it is too late.
TEST_F(ReceiveTest, LongestTokens) {
  const struct {
    const char* framing;
    std::string head;
    std::string tail;
    int longest;
    const char* rest;  // what a tail makes whose token was dropped in front of it
  } rows[] = {{"rx_suffix=03", "", "\x03", 1000, "[]"},
              {"rx_suffix=0303", "", "\x03\x03", 999, ""},
              {"rx_prefix=02 rx_suffix=03", "\x02", "\x03", 999, ""},
              {"rx_prefix=0202 rx_suffix=030303", "\x02\x02", "\x03\x03\x03", 996, ""},
              {"rx_prefix=02", "\x02", "\x02", 999, ""},
              {"rx_prefix=0204", "\x02\x04", "\x02\x04", 997, ""}};
  for (const auto& row : rows) {
    ProtocolUnderTest protocol(plugin_);
    ASSERT_TRUE(protocol.Config(Mandatory(row.framing)));
    ASSERT_NE(protocol->Start(), 0);
    for (const int length : {row.longest, row.longest + 1}) {
      const std::string body(static_cast<std::size_t>(length), 'b');
      host_.Line().Feed(row.head + body + row.tail);
      host_.RunUntilSilent();
      EXPECT_EQ(protocol.TakeTokens(), length == row.longest ? "[" + body + "]" : row.rest)
          << row.framing << " " << length;
    }
    protocol->Stop();
  }
}

TEST_F(ReceiveTest, LongestGapToken) {
  Run();
  Receive(std::string(1000, 'a'));
  EXPECT_EQ(P().TakeTokens(), "[" + std::string(1000, 'a') + "]");
  Receive(std::string(1001, 'a'));
  EXPECT_EQ(P().TakeTokens(), "");
  Receive(std::string(1001, 'a') + "bc");
  EXPECT_EQ(P().TakeTokens(), "[bc]");
}

TEST_F(ReceiveTest, AfterAnOverflowTheNextPassStartsAfresh) {
  Run("rx_prefix=02 rx_suffix=03");
  Receive("\x02" + std::string(1000, 'a') + "b\x03\x02\x43\x03");
  EXPECT_EQ(P().TakeTokens(), "[C]");
}

// A prefix token that is queued starts the count of its successor anew.
TEST_F(ReceiveTest, APrefixStartsANewBuffer) {
  Run("rx_prefix=02");
  const std::string body(900, 'a');
  Receive("\x02" + body + "\x02" + body + "\x02" + body);
  EXPECT_EQ(P().TakeTokens(), "[" + body + "][" + body + "][" + body + "]");
}

TEST_F(ReceiveTest, FramesLongerThanTheBuffer) {
  std::string prefix;
  for (int i = 0; i < 1200; ++i) prefix += "41";
  Run("rx_prefix=" + prefix + " rx_suffix=03");
  Receive(std::string(1200, 'A') + "\x03");
  EXPECT_EQ(P().TakeTokens(), "[]") << "the suffix is looked at before the length";
  Receive(std::string(1200, 'A') + "b\x03");
  EXPECT_EQ(P().TakeTokens(), "");
}

TEST_F(ReceiveTest, TheOldestTokenGivesWay) {
  Run("rx_suffix=03 token_queue_size=3");
  Receive(
      "A\x03"
      "B\x03"
      "C\x03"
      "D\x03");
  EXPECT_EQ(P().ReadNumber("tokens_available"), 3U);
  EXPECT_EQ(P().TakeTokens(), "[B][C][D]");
}

TEST_F(ReceiveTest, AQueueOfOne) {
  Run("rx_suffix=03 token_queue_size=1");
  Receive(
      "A\x03"
      "B\x03");
  EXPECT_EQ(P().TakeTokens(), "[B]");
}

TEST_F(ReceiveTest, AHundredTokensByDefault) {
  Run("rx_suffix=03");
  for (int i = 0; i < 101; ++i) host_.Line().Feed(std::to_string(i) + "\x03");
  host_.RunUntilSilent();
  EXPECT_EQ(P().ReadNumber("tokens_available"), 100U);
  EXPECT_EQ(P().ReadText("rx_token"), "1");
}

TEST_F(ReceiveTest, TheLargestQueue) {
  host_.Log().SetRecording(false);
  ASSERT_TRUE(P().Config(Mandatory("rx_suffix=03 token_queue_size=10000")));
  ASSERT_NE(P()->Start(), 0);
  for (int i = 0; i < 10003; ++i) host_.Line().Feed(std::to_string(i) + "\x03");
  host_.RunUntilSilent();
  EXPECT_EQ(P().ReadNumber("tokens_available"), 10000U);
  EXPECT_EQ(P().ReadText("rx_token"), "3");
}

TEST_F(ReceiveTest, AQueueSizeOfZeroOrLessKeepsOneToken) {
  for (const unsigned size : {0U, 0xFFFFFFFFU, 0x80000000U}) {
    ProtocolUnderTest protocol(plugin_);
    ASSERT_TRUE(protocol.Config(Mandatory("rx_suffix=03")));
    ASSERT_NE(protocol->Start(), 0);
    ASSERT_TRUE(protocol.WriteNumber("SP_TokenQueueSize", size));
    ASSERT_TRUE(protocol.WriteFlag("SP_Done", 1));
    host_.Line().Feed(
        "A\x03"
        "B\x03"
        "C\x03");
    host_.RunUntilSilent();
    EXPECT_EQ(protocol.TakeTokens(), "[C]") << size;
    protocol->Stop();
  }
}

// Each pass looks at the framing anew, so a change counts from the next token on.
TEST_F(ReceiveTest, ChangedFramingAppliesToTheNextPass) {
  Run("rx_suffix=03");
  host_.Line().Feed(
      "A\x03"
      "B\x04"
      "C\x05");
  ASSERT_TRUE(P().WriteText("SP_RxSuffix", "04"));
  ASSERT_TRUE(P().WriteNumber("SP_Gap", 60));
  host_.RunPasses(1);
  EXPECT_EQ(P().ReadNumber("tokens_available"), 1U);
  ASSERT_TRUE(P().WriteFlag("SP_Done", 1));
  EXPECT_EQ(P().ReadNumber("tokens_available"), 0U) << "applying settings empties the queue";
  Calls();
  host_.RunPasses(1);
  EXPECT_NE(Calls().find("Receive 60 -> 42"), std::string::npos);
  EXPECT_EQ(P().TakeTokens(), "[B]");
}

// The settings of a token that has begun stay as they were.
TEST_F(ReceiveTest, ChangedFramingLeavesATokenThatHasBegun) {
  Run("rx_suffix=03");
  ASSERT_TRUE(P().WriteText("SP_RxSuffix", "04"));
  ASSERT_TRUE(P().WriteNumber("SP_Gap", 60));
  host_.Line().Feed(
      "A\x04\x03"
      "B\x04");
  host_.MultiTask().Semaphore("port")->BeforeNthLock(
      2, [this] { EXPECT_TRUE(P().WriteFlag("SP_Done", 1)); });
  host_.RunPasses(1);
  EXPECT_NE(Calls().find("Receive 500 -> 03"), std::string::npos);
  EXPECT_EQ(P().TakeTokens(), "[A\x04]");
  host_.RunPasses(1);
  EXPECT_EQ(P().TakeTokens(), "[B]");
}

// Whether a token becomes hexadecimal text is decided when it is queued.
TEST_F(ReceiveTest, HexModeCountsAtTheEndOfAToken) {
  Run("rx_suffix=03");
  char reply[40] = {};
  host_.MultiTask().Semaphore("port")->BeforeNthLock(
      2, [&] { EXPECT_TRUE(P()->DoCommand("set_hexToken ON", reply, sizeof reply)); });
  Receive("AB\x03");
  EXPECT_STREQ(reply, "OK");
  EXPECT_TRUE(P()->DoCommand("set_hexToken OFF", reply, sizeof reply));
  EXPECT_EQ(P().TakeTokens(), "[4142]") << "what is queued keeps its form";
}

TEST_F(ReceiveTest, ADisconnectWithinATokenDropsIt) {
  Run("rx_prefix=02 rx_suffix=03");
  host_.Line().Feed("\x02\x41");
  host_.MultiTask().Semaphore("port")->BeforeNthLock(
      3, [this] { EXPECT_TRUE(P().WriteFlag("connect", 0)); });
  host_.RunPasses(2);
  const std::string calls = Calls();
  EXPECT_EQ(calls.substr(calls.find("queue.Lock")),
            "queue.Lock\nport.Lock\nReleasePort com1\nport.Unlock\nqueue.Unlock\n"
            "port.Lock\nport.Unlock\nSleep 0\nIsToEnd -> 0\nSleep 10\nSleep 0\nIsToEnd -> 1\n");
  ASSERT_TRUE(P().WriteFlag("connect", 1));
  Receive("\x42\x03\x02\x43\x03");
  EXPECT_EQ(P().TakeTokens(), "[C]");
}

TEST_F(ReceiveTest, ADisconnectWithinAPrefixDropsIt) {
  Run("rx_prefix=0204 rx_suffix=03");
  host_.Line().Feed("\x02");
  host_.MultiTask().Semaphore("port")->BeforeNthLock(
      2, [this] { EXPECT_TRUE(P().WriteFlag("connect", 0)); });
  host_.RunPasses(1);
  ASSERT_TRUE(P().WriteFlag("connect", 1));
  Receive("\x04\x43\x03");
  EXPECT_EQ(P().TakeTokens(), "");
}

TEST_F(ReceiveTest, NothingIsReceivedWhileDisconnected) {
  Run("rx_suffix=03");
  ASSERT_TRUE(P().WriteFlag("connect", 0));
  Calls();
  host_.Line().Feed("A\x03");
  host_.RunPasses(1);
  EXPECT_EQ(Calls(), "IsToEnd -> 0\nSleep 10\nSleep 0\nIsToEnd -> 1\n");
  ASSERT_TRUE(P().WriteFlag("connect", 1));
  host_.RunPasses(1);
  EXPECT_EQ(P().TakeTokens(), "[A]");
}

// A failing receive is a time-out; nothing is reported anywhere.
TEST_F(ReceiveTest, NothingIsReported) {
  Run("rx_prefix=02 rx_suffix=03");
  Receive("garbage\x02" + std::string(2000, 'a'));
  EXPECT_EQ(P().Error(), "1 ");
}

TEST_F(ReceiveTest, ANegativeGapIsPassedOn) {
  Run("gap=-5");
  Receive("A");
  EXPECT_NE(Calls().find("Receive -5 -> 41"), std::string::npos);
}

}  // namespace
