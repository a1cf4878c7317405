// SPDX-License-Identifier: Apache-2.0
// The driver's own console commands: replies, results, host calls, and that nothing is stored.
#include "tests/plugin/ConsoleFixture.h"

namespace {

constexpr const char* kHelp =
    "help - displays this message\n"
    "info - displays information about the protocol version\n"
    "xml  - displays the protocol xml description\n"
    "read uri - reads data pointed by uri string\n"
    "write uri hexData - writes data pointed by uri string\n"
    "lasterror - displays the last protocol error\n"
    "getmaxtm - displays the max time for executing a single read/write access\n"
    "connect cmd - set connect ON or OFF\n"
    "get_stat - get status of connection\n"
    "put str - put the token to send\n"
    "get - get the received token\n"
    "get_token_length - get the length of the received token\n"
    "tokens_available - get number of tokens received\n"
    "token_ack - acknowledge reading token - \"token_ack all\" clears the queue\n"
    "set_hexToken ON/OFF - set the hexToken mode\n"
    "set_rxGap value - set the rx gap in ms\n"
    "set_rxPrefix string - set the rx prefix\n"
    "set_rxSuffix string - set the rx suffix\n"
    "set_txPrefix string - set the tx prefix\n"
    "set_txSuffix string - set the tx suffix\n";

class TokenConsoleTest : public ConsoleFixture {
 protected:
  void ExpectReply(const std::string& command, const std::string& text, bool result) {
    const ConsoleReply reply = Command(command);
    EXPECT_EQ(reply.text, text) << command;
    EXPECT_EQ(reply.result, result) << command;
  }
};

TEST_F(TokenConsoleTest, HelpIsBothTexts) {
  ExpectReply("help", kHelp, true);
  ExpectReply("help me", kHelp, true);
}

TEST_F(TokenConsoleTest, HelpIsCutAtAnySize) {
  const std::string whole = kHelp;
  for (std::size_t size = 0; size <= whole.size() + 3; ++size) {
    const ConsoleReply reply = Command("help", static_cast<int>(size));
    EXPECT_TRUE(reply.result);
    EXPECT_EQ(reply.text, whole.substr(0, size));
    EXPECT_EQ(reply.terminated, size > whole.size());
  }
}

// --- connect ---

TEST_F(TokenConsoleTest, ConnectArguments) {
  Run("autoConnect=false");
  ExpectReply("connect", "ERROR: new connect state is missing", false);
  ExpectReply("connect on", "ERROR: wrong value", false);
  ExpectReply("connect off", "ERROR: wrong value", false);
  ExpectReply("connect  ON", "ERROR: wrong value", false);
  ExpectReply("connect 1", "ERROR: wrong value", false);
  ExpectReply("connect ", "ERROR: wrong value", false);
  EXPECT_EQ(Calls(), "");
  ExpectReply("connect ON please", "OK", true);
}

TEST_F(TokenConsoleTest, ConnectTakesThePortSemaphoreOnly) {
  Run();
  ExpectReply("connect OFF", "OK", true);
  EXPECT_EQ(Calls(), "port.Lock\nReleasePort com1\nport.Unlock\n");
  ExpectReply("connect OFF", "OK", true);
  EXPECT_EQ(Calls(), "");
  ExpectReply("connect ON", "OK", true);
  EXPECT_EQ(Calls(), "port.Lock\nOpenPort com1\nSetup 9600 1 8 1 0\nport.Unlock\n");
  ExpectReply("connect ON", "OK", true);
  EXPECT_EQ(Calls(), "port.Lock\nport.Unlock\n");
}

// A pass of the receive task that waits for the semaphore must find the link closed already.
TEST_F(TokenConsoleTest, ConnectOffClosesTheLinkBeforeItWaitsForTheSemaphore) {
  Run();
  std::string status;
  host_.MultiTask().Semaphore("port")->BeforeNthLock(1, [&] { status = Command("get_stat").text; });
  ExpectReply("connect OFF", "OK", true);
  EXPECT_EQ(status, "Disconnected");
}

TEST_F(TokenConsoleTest, CommandsBeforeTheStart) {
  ASSERT_TRUE(P().Config(Mandatory()));
  ExpectReply("get_stat", "Disconnected", true);
  ExpectReply("put A", "ERROR: serial port is not active for sending", false);
  ExpectReply("get", "", true);
  ExpectReply("connect ON", "OK", true);
  EXPECT_EQ(Calls(), "port.Lock\nOpenPort com1\nSetup 9600 1 8 1 0\nport.Unlock\n");
  ExpectReply("put A", "OK", true);
  EXPECT_EQ(Calls(), "Send 41\n");
  EXPECT_EQ(P().Error(), "1 ");
  EXPECT_NE(P()->Stop(), 0);
  EXPECT_EQ(Calls(), "") << "what was never started is not stopped";
  P().Delete();
  EXPECT_EQ(Calls(), "DeleteSemaphore queue\nDeleteSemaphore port\nReleasePort com1\n");
}

TEST_F(TokenConsoleTest, ConnectWithTheSettingsInEffect) {
  Run();
  Command("connect OFF");
  ASSERT_TRUE(P().WriteNumber("SP_Baud", 19200));
  ASSERT_TRUE(P().WriteByte("SP_Bits", 7));
  Calls();
  ExpectReply("connect ON", "OK", true);
  EXPECT_EQ(Calls(), "port.Lock\nOpenPort com1\nSetup 9600 1 8 1 0\nport.Unlock\n");
  Command("connect OFF");
  ASSERT_TRUE(P().WriteFlag("SP_Done", 1));
  Calls();
  ExpectReply("connect ON", "OK", true);
  EXPECT_EQ(Calls(), "port.Lock\nOpenPort com1\nSetup 19200 1 7 1 0\nport.Unlock\n");
}

TEST_F(TokenConsoleTest, ConnectThatFailsLeavesTheErrorState) {
  Run("autoConnect=false");
  host_.Faults().FailNth("OpenPort", 1);
  ExpectReply("connect ON", "Can't open serial port", true);
  EXPECT_EQ(Calls(), "port.Lock\nOpenPort com1\nport.Unlock\n");
  EXPECT_EQ(P().Error(), "1 ");
  host_.Faults().Clear();
  host_.Faults().FailNth("Setup", 1);
  ExpectReply("connect ON", "Can't open serial port", true);
  EXPECT_EQ(Calls(),
            "port.Lock\nOpenPort com1\nSetup 9600 1 8 1 0\nReleasePort com1\nport.Unlock\n");
  EXPECT_EQ(P().Error(), "1 ");
  ExpectReply("get_stat", "Disconnected", true);
}

TEST_F(TokenConsoleTest, StatusFollowsTheConnection) {
  Run();
  ExpectReply("get_stat", "Connected", true);
  ExpectReply("get_stat now", "Connected", true);
  Command("connect OFF");
  ExpectReply("get_stat", "Disconnected", true);
  EXPECT_FALSE(P().ReadFlag("connect"));
  ASSERT_TRUE(P().WriteFlag("connect", 1));
  ExpectReply("get_stat", "Connected", true);
}

// --- put ---

TEST_F(TokenConsoleTest, PutSendsTheRestOfTheLine) {
  Run("tx_prefix=02 tx_suffix=03");
  const struct {
    const char* command;
    const char* call;
  } rows[] = {
      {"put hello", "Send 02 68 65 6C 6C 6F 03\n"},
      {"put hello world", "Send 02 68 65 6C 6C 6F 20 77 6F 72 6C 64 03\n"},
      {"put    a  b ", "Send 02 61 20 20 62 20 03\n"},
      {"put ", "Send 02 03\n"},
      {"put    ", "Send 02 03\n"},
      {"put put", "Send 02 70 75 74 03\n"},
      {"put \ta", "Send 02 09 61 03\n"},
      {"\tput \ta", "Send 02 09 61 03\n"},
  };
  for (const auto& row : rows) {
    ExpectReply(row.command, "OK", true);
    EXPECT_EQ(Calls(), row.call) << row.command;
  }
}

TEST_F(TokenConsoleTest, PutTakesNoSemaphoreAndIgnoresTheResult) {
  Run();
  host_.Faults().FailAlways("Send");
  ExpectReply("put x", "OK", true);
  EXPECT_EQ(Calls(), "Send 78\n");
}

TEST_F(TokenConsoleTest, PutWithoutAToken) {
  Run();
  ExpectReply("put", "ERROR: string to send is missing", false);
  EXPECT_EQ(Calls(), "");
}

TEST_F(TokenConsoleTest, PutInHexMode) {
  Run("hex_tokens=true tx_suffix=0D");
  ExpectReply("put 0D0A", "OK", true);
  EXPECT_EQ(Calls(), "Send 0D 0A 0D\n");
  ExpectReply("put none", "OK", true);
  EXPECT_EQ(Calls(), "Send 0D\n");
  for (const char* command : {"put 0D0", "put 0D 0A", "put 0d0g", "put 0D0A "}) {
    ExpectReply(command, "ERROR: token to send must be in hex format", false);
    EXPECT_EQ(Calls(), "") << command;
  }
  EXPECT_EQ(P().Error(), "1 ");
}

TEST_F(TokenConsoleTest, PutWhileDisconnected) {
  Run("autoConnect=false hex_tokens=true");
  ExpectReply("put 41", "ERROR: serial port is not active for sending", false);
  ExpectReply("put 4", "ERROR: token to send must be in hex format", false);
  Command("set_hexToken OFF");
  ExpectReply("put 4", "ERROR: serial port is not active for sending", false);
  EXPECT_EQ(P().Error(), "1 ");
  EXPECT_EQ(Calls(), "");
}

// --- tokens ---

TEST_F(TokenConsoleTest, TokensAreShownCountedAndAcknowledged) {
  Run();
  ExpectReply("get", "", true);
  ExpectReply("tokens_available", "0", true);
  ExpectReply("get_token_length", "0", true);
  ExpectReply("token_ack", "OK", true);
  Receive("\x02one\x03\x02three\x03\x02!\x03");
  Calls();
  ExpectReply("get", "one", true);
  ExpectReply("get again", "one", true);
  ExpectReply("tokens_available", "3", true);
  ExpectReply("get_token_length", "3", true);
  ExpectReply("token_ack", "OK", true);
  ExpectReply("get", "three", true);
  ExpectReply("get_token_length", "5", true);
  EXPECT_EQ(Calls(), "") << "these commands take no semaphore";
}

TEST_F(TokenConsoleTest, AcknowledgeAll) {
  Run();
  Receive(
      "\x02"
      "a\x03\x02"
      "b\x03\x02"
      "c\x03");
  ExpectReply("token_ack all extra", "OK", true);
  ExpectReply("tokens_available", "2", true);
  ExpectReply("token_ack ALL", "OK", true);
  ExpectReply("tokens_available", "1", true);
  Receive(
      "\x02"
      "d\x03");
  ExpectReply("token_ack all", "OK", true);
  ExpectReply("tokens_available", "0", true);
}

TEST_F(TokenConsoleTest, GetShowsATokenUpToItsFirstZero) {
  Run();
  Receive(
      std::string("\x02"
                  "ab\0cd\x03",
                  7));
  ExpectReply("get", "ab", true);
  ExpectReply("get_token_length", "5", true);
}

TEST_F(TokenConsoleTest, GetShowsWhatIsQueuedWhateverTheMode) {
  Run("hex_tokens=true");
  Receive(
      "\x02"
      "AB\x03");
  ExpectReply("get", "4142", true);
  ExpectReply("get_token_length", "4", true);
  Command("set_hexToken OFF");
  ExpectReply("get", "4142", true);
}

TEST_F(TokenConsoleTest, GetIntoASmallReply) {
  Run();
  Receive("\x02HELLO\x03");
  EXPECT_EQ(Command("get", 3).bytes, "HEL");
  EXPECT_EQ(Command("get", 5).bytes, "HELLO");
  EXPECT_EQ(Command("get", 7).bytes, std::string("HELLO\0\0", 7));
  const ConsoleReply nothing = Command("get", 0);
  EXPECT_TRUE(nothing.result);
}

// --- settings ---

TEST_F(TokenConsoleTest, SettersWithoutAValue) {
  for (const char* command : {"set_hexToken", "set_rxGap", "set_rxPrefix", "set_rxSuffix",
                              "set_txPrefix", "set_txSuffix"}) {
    ExpectReply(command, "ERROR: new value is missing", false);
  }
}

TEST_F(TokenConsoleTest, HexMode) {
  Run();
  ExpectReply("set_hexToken ON", "OK", true);
  Receive(
      "\x02"
      "A\x03");
  ExpectReply("set_hexToken OFF", "OK", true);
  Receive(
      "\x02"
      "A\x03");
  EXPECT_EQ(P().TakeTokens(), "[41][A]");
  for (const char* command : {"set_hexToken on", "set_hexToken 1", "set_hexToken true",
                              "set_hexToken ", "set_hexToken  ON"}) {
    ExpectReply(command, "ERROR: wrong value", true);
  }
  ExpectReply("set_hexToken ON and more", "OK", true);
  ExpectReply("set_hexToken off", "ERROR: wrong value", true);
  Receive(
      "\x02"
      "A\x03");
  EXPECT_EQ(P().TakeTokens(), "[41]") << "a wrong value changes nothing";
}

TEST_F(TokenConsoleTest, Gap) {
  Run();
  const struct {
    const char* argument;
    const char* timeout;
  } rows[] = {{"50", "50"},      {"50ms", "50"}, {"+7", "7"},     {"-3", "-3"},
              {"0", "500"},      {"010", "10"},  {"0x20", "500"}, {"99999999999", "2147483647"},
              {"200 300", "200"}};
  for (const auto& row : rows) {
    ExpectReply(std::string("set_rxGap ") + row.argument, "OK", true);
    Calls();
    host_.RunPasses(1);
    EXPECT_NE(Calls().find(std::string("Receive ") + row.timeout + " "), std::string::npos)
        << row.argument;
  }
  ExpectReply("set_rxGap x", "ERROR: wrong value", true);
  ExpectReply("set_rxGap ", "ERROR: wrong value", true);
  ExpectReply("set_rxGap ms50", "ERROR: wrong value", true);
  ExpectReply("set_rxGap -", "ERROR: wrong value", true);
  Calls();
  host_.RunPasses(1);
  EXPECT_NE(Calls().find("Receive 200 "), std::string::npos) << "a wrong value changes nothing";
}

TEST_F(TokenConsoleTest, ReceiveFramingAppliesFromTheNextPassOn) {
  Run();
  ExpectReply("set_rxPrefix 5B", "OK", true);
  ExpectReply("set_rxSuffix 5D0A extra", "OK", true);
  Receive("\x02no\x03[yes]\n[");
  EXPECT_EQ(P().TakeTokens(), "[yes]");
  ExpectReply("set_rxPrefix none", "OK", true);
  ExpectReply("set_rxSuffix ", "OK", true);
  Receive("free");
  EXPECT_EQ(P().TakeTokens(), "[free]");
}

TEST_F(TokenConsoleTest, TransmitFramingIsTakenUnchecked) {
  Run();
  ExpectReply("set_txPrefix 7", "OK", true);
  ExpectReply("set_txSuffix zz", "OK", true);
  Calls();
  ExpectReply("put A", "OK", true);
  // An odd digit is paired with the text's end (169); a letter counts its code minus 87.
  EXPECT_EQ(Calls(), "Send 19 41 53\n");
}

TEST_F(TokenConsoleTest, SettersTakeNoSemaphoreAndStoreNothing) {
  Run();
  const std::string stored = host_.Storage().Dump();
  for (const char* command : {"set_hexToken ON", "set_rxGap 20", "set_rxPrefix 01",
                              "set_rxSuffix 04", "set_txPrefix 01", "set_txSuffix 04"}) {
    ExpectReply(command, "OK", true);
  }
  EXPECT_EQ(Calls(), "");
  EXPECT_EQ(host_.Storage().Dump(), stored);
  // The tags show what is staged or active, which the console does not change.
  EXPECT_EQ(P().ReadText("SP_RxPrefix"), "02");
  EXPECT_EQ(P().ReadNumber("SP_Gap"), 0U);
  // A restart runs with the active values again.
  P()->Stop();
  ASSERT_NE(P()->Start(), 0);
  Receive(
      "\x02"
      "A\x03");
  EXPECT_EQ(P().TakeTokens(), "[A]");
}

TEST_F(TokenConsoleTest, OtherCommandsReachTheGenericConsole) {
  ExpectReply("getmaxtm", "maxtm = 0 ms\n", true);
  EXPECT_EQ(Command("info").text.substr(0, 26), "Protocol: LOKA (471) v.111");
  ExpectReply("read", "error: missing parameter (URI string)\n", true);
  EXPECT_FALSE(Command("Connect ON").result);
  EXPECT_FALSE(Command("GET").result);
}

}  // namespace
