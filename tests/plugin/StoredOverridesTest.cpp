// SPDX-License-Identifier: Apache-2.0
// Overrides in permanent storage and what is staged: over a restart, a change of the ident, and
// beside the changes of the console.
#include "tests/plugin/PluginFixture.h"

namespace {

class StoredOverridesTest : public ProtocolFixture {
 protected:
  // A console command that has to be answered with "OK".
  void Console(const char* command) {
    char reply[200] = {};
    EXPECT_TRUE(P()->DoCommand(command, reply, sizeof reply)) << command;
    EXPECT_STREQ(reply, "OK") << command;
  }
};

TEST_F(StoredOverridesTest, WinOverTheConfiguration) {
  host_.Storage().Put("LOKA", "baud", 38400);
  host_.Storage().Put("LOKA", "parity", 4);
  host_.Storage().Put("LOKA", "bits", 7);
  host_.Storage().Put("LOKA", "stop", 2);
  host_.Storage().Put("LOKA", "mode", 3);
  host_.Storage().PutString("LOKA", "rx_prefix", "02");
  host_.Storage().PutString("LOKA", "rx_suffix", "03");
  host_.Storage().PutString("LOKA", "tx_prefix", "04");
  host_.Storage().PutString("LOKA", "tx_suffix", "05");
  host_.Storage().Put("LOKA", "gap", 33);
  host_.Storage().PutBoolean("LOKA", "hex_tokens", true);
  host_.Storage().Put("LOKA", "token_queue_size", 2);
  ASSERT_TRUE(P().Config(Mandatory("rx_prefix=FF hex_tokens=false gap=1")));
  ASSERT_NE(P()->Start(), 0);
  EXPECT_EQ(Calls(),
            "Exists LOKA baud -> 1\nGetInteger LOKA baud -> 38400\n"
            "Exists LOKA parity -> 1\nGetInteger LOKA parity -> 4\n"
            "Exists LOKA bits -> 1\nGetInteger LOKA bits -> 7\n"
            "Exists LOKA stop -> 1\nGetInteger LOKA stop -> 2\n"
            "Exists LOKA mode -> 1\nGetInteger LOKA mode -> 3\n"
            "Exists LOKA rx_prefix -> 1\nConvertTo IPermanentStorage2 -> 0\n"
            "GetString LOKA rx_prefix -> 02\n"
            "Exists LOKA rx_suffix -> 1\nConvertTo IPermanentStorage2 -> 0\n"
            "GetString LOKA rx_suffix -> 03\n"
            "Exists LOKA tx_prefix -> 1\nConvertTo IPermanentStorage2 -> 0\n"
            "GetString LOKA tx_prefix -> 04\n"
            "Exists LOKA tx_suffix -> 1\nConvertTo IPermanentStorage2 -> 0\n"
            "GetString LOKA tx_suffix -> 05\n"
            "Exists LOKA gap -> 1\nGetInteger LOKA gap -> 33\n"
            "Exists LOKA hex_tokens -> 1\nGetBoolean LOKA hex_tokens -> true\n"
            "Exists LOKA token_queue_size -> 1\nGetInteger LOKA token_queue_size -> 2\n"
            "OpenPort com1\nSetup 38400 4 7 2 3\nCreateTask 3\ntask.Start\n");
  EXPECT_EQ(P().ReadText("SP_RxPrefix"), "02");
  EXPECT_EQ(P().ReadNumber("SP_Gap"), 33U);
  EXPECT_TRUE(P().ReadFlag("SP_HexTokens"));
  EXPECT_TRUE(P().WriteText("tx_token", "41"));
  EXPECT_EQ(host_.Log().Count("Send 04 41 05"), 1);
}

TEST_F(StoredOverridesTest, TextsThroughTheExtendedStorage) {
  host_.Storage().SetExtended(true);
  host_.Storage().PutString("LOKA", "rx_prefix", "02");
  ASSERT_TRUE(P().Config(Mandatory()));
  ASSERT_NE(P()->Start(), 0);
  const std::string calls = Calls();
  EXPECT_NE(calls.find("Exists LOKA rx_prefix -> 1\nConvertTo IPermanentStorage2 -> 1\n"
                       "GetStringInto LOKA rx_prefix 256 -> 1\nExists LOKA rx_suffix -> 0\n"),
            std::string::npos)
      << calls;
  EXPECT_EQ(P().ReadText("SP_RxPrefix"), "02");
}

TEST_F(StoredOverridesTest, AnExtendedReadThatFailsGivesTheEmptyText) {
  host_.Storage().SetExtended(true);
  host_.Storage().PutString("LOKA", "rx_prefix", std::string(300, '0'));
  host_.Storage().PutString("LOKA", "tx_prefix", std::string(254, '4'));
  Run("rx_prefix=FF tx_prefix=FF");
  EXPECT_EQ(P().ReadText("SP_RxPrefix"), "") << "not the configured text";
  EXPECT_EQ(P().ReadText("SP_TxPrefix", 300), std::string(254, '4'));
}

TEST_F(StoredOverridesTest, NumbersNeverUseTheExtendedStorage) {
  host_.Storage().SetExtended(true);
  host_.Storage().Put("LOKA", "baud", 300);
  host_.Storage().PutBoolean("LOKA", "hex_tokens", true);
  ASSERT_TRUE(P().Config(Mandatory()));
  ASSERT_NE(P()->Start(), 0);
  EXPECT_EQ(Calls().find("IPermanentStorage2"), std::string::npos);
}

TEST_F(StoredOverridesTest, SurviveARestartOfTheDriver) {
  Run();
  ASSERT_TRUE(P().WriteNumber("SP_Baud", 300));
  ASSERT_TRUE(P().WriteText("SP_RxSuffix", "0A"));
  ASSERT_TRUE(P().WriteFlag("SP_HexTokens", 1));
  ASSERT_TRUE(P().WriteFlag("SP_Done", 1));
  EXPECT_EQ(host_.Storage().Dump(),
            "LOKA baud = 300\nLOKA hex_tokens = true\nLOKA rx_suffix = '0A'\n");
  P()->Stop();
  ProtocolUnderTest next(plugin_);
  ASSERT_TRUE(next.Config(Mandatory()));
  ASSERT_NE(next->Start(), 0);
  EXPECT_EQ(next.ComParams(), "com1,300,even,8,1,RS-232");
  EXPECT_EQ(next.ReadText("SP_RxSuffix"), "0A");
  EXPECT_TRUE(next.ReadFlag("SP_HexTokens"));
  next->Stop();
}

TEST_F(StoredOverridesTest, OnlyDoneStores) {
  Run();
  ASSERT_TRUE(P().WriteNumber("SP_Baud", 300));
  P()->Stop();
  P().Delete();
  EXPECT_EQ(host_.Storage().Dump(), "");
}

TEST_F(StoredOverridesTest, EachIdentHasItsOwn) {
  P()->SetIdent("one");
  Run();
  ASSERT_TRUE(P().WriteNumber("SP_Gap", 11));
  ASSERT_TRUE(P().WriteFlag("SP_Done", 1));
  EXPECT_EQ(host_.Storage().Dump(), "one gap = 11\n");
  ProtocolUnderTest other(plugin_);
  other->SetIdent("two");
  ASSERT_TRUE(other.Config(Mandatory("port=com2")));
  ASSERT_NE(other->Start(), 0);
  EXPECT_EQ(other.ReadNumber("SP_Gap"), 0U);
  other->Stop();
}

// Stored framing texts are never checked; each character counts its digit value, and an odd text
// takes its terminating zero as the last digit.
TEST_F(StoredOverridesTest, AnyStoredTextIsTurnedIntoBytes) {
  const struct {
    const char* text;
    const char* sent;
  } rows[] = {{"", "Send 58"},
              {"none", "Send 58"},
              {"41", "Send 41 58"},
              {"aF", "Send AF 58"},
              {"Af", "Send AF 58"},
              {"4", "Send E9 58"},
              {"414", "Send 41 E9 58"},
              {"zz", "Send 53 58"},
              {"0g", "Send 10 58"},
              {"G0", "Send 00 58"},
              {"\xFF"
               "0",
               "Send 80 58"},
              {"None", "Send 88 7E 58"}};
  for (const auto& row : rows) {
    host_.Storage().PutString("LOKA", "tx_prefix", row.text);
    ProtocolUnderTest protocol(plugin_);
    ASSERT_TRUE(protocol.Config(Mandatory()));
    ASSERT_NE(protocol->Start(), 0);
    Calls();
    EXPECT_TRUE(protocol.WriteText("tx_token", "X"));
    const std::string calls = Calls();
    EXPECT_NE(calls.find(std::string(row.sent) + "\n"), std::string::npos) << row.text << calls;
    protocol->Stop();
  }
}

TEST_F(StoredOverridesTest, WrongTypesGiveZeroAndEmpty) {
  host_.Storage().PutString("LOKA", "baud", "300");
  host_.Storage().Put("LOKA", "rx_prefix", 2);
  host_.Storage().Put("LOKA", "hex_tokens", 1);
  host_.Storage().PutBoolean("LOKA", "token_queue_size", true);
  Run("rx_prefix=FF hex_tokens=true rx_suffix=03");
  EXPECT_EQ(P().ReadNumber("SP_Baud"), 0U);
  EXPECT_EQ(P().ReadText("SP_RxPrefix"), "");
  EXPECT_FALSE(P().ReadFlag("SP_HexTokens"));
  EXPECT_EQ(P().ReadNumber("SP_TokenQueueSize"), 0U);
  Receive(
      "A\x03"
      "B\x03");
  EXPECT_EQ(P().TakeTokens(), "[B]");
}

TEST_F(StoredOverridesTest, AnUnterminatedStoredTextIsCutAtTheBuffer) {
  host_.Storage().SetExtended(true);
  host_.Storage().SetUnterminated(true);
  host_.Storage().PutString("LOKA", "tx_prefix", "any");
  Run();
  const std::string text = P().ReadText("SP_TxPrefix", 2000);
  EXPECT_LE(text.size(), 256U);
  EXPECT_EQ(text, std::string(text.size(), 'A'));
}

// The receive task runs with them too, not only the tags.
TEST_F(StoredOverridesTest, RunTheReceiveTask) {
  host_.Storage().PutString("LOKA", "rx_prefix", "02");
  host_.Storage().PutString("LOKA", "rx_suffix", "03");
  host_.Storage().Put("LOKA", "gap", 33);
  host_.Storage().PutBoolean("LOKA", "hex_tokens", true);
  host_.Storage().Put("LOKA", "token_queue_size", 2);
  Run("rx_prefix=04 rx_suffix=05 gap=70 token_queue_size=9");
  Receive("\x02\x41\x03\x02\x42\x03\x02\x43\x03");
  const std::string calls = Calls();
  EXPECT_NE(calls.find("Receive 33 -> 02"), std::string::npos) << calls;
  EXPECT_EQ(calls.find("Receive 70"), std::string::npos) << calls;
  EXPECT_EQ(P().TakeTokens(), "[42][43]");
}

TEST_F(StoredOverridesTest, ActiveValuesOutliveAStop) {
  Run("rx_suffix=03");
  ASSERT_TRUE(P().WriteNumber("SP_Baud", 300));
  ASSERT_TRUE(P().WriteText("SP_TxPrefix", "04"));
  ASSERT_TRUE(P().WriteFlag("SP_Done", 1));
  P()->Stop();
  Calls();
  ASSERT_NE(P()->Start(), 0);
  EXPECT_EQ(Calls(), "OpenPort com1\nSetup 300 1 8 1 0\nCreateTask 3\ntask.Start\n");
  EXPECT_TRUE(P().WriteText("tx_token", "A"));
  EXPECT_EQ(Calls(), "queue.Lock\nSend 04 41\nqueue.Unlock\n");
}

// What is staged waits for SP_Done through a restart; the restart itself does not use it.
TEST_F(StoredOverridesTest, StagedValuesOutliveAStop) {
  Run();
  ASSERT_TRUE(P().WriteNumber("SP_Baud", 300));
  ASSERT_TRUE(P().WriteFlag("SP_HexTokens", 1));
  P()->Stop();
  Calls();
  ASSERT_NE(P()->Start(), 0);
  EXPECT_EQ(Calls(), "OpenPort com1\nSetup 9600 1 8 1 0\nCreateTask 3\ntask.Start\n");
  EXPECT_EQ(P().ReadNumber("SP_Baud"), 300U);
  EXPECT_TRUE(P().ReadFlag("SP_HexTokens"));
  ASSERT_TRUE(P().WriteFlag("SP_Done", 1));
  EXPECT_EQ(Calls(),
            "queue.Lock\nSetInteger LOKA baud 300\nSetBoolean LOKA hex_tokens true\n"
            "Setup 300 1 8 1 0\nqueue.Unlock\n");
}

TEST_F(StoredOverridesTest, ANewIdentCountsFromTheNextStart) {
  P()->SetIdent("one");
  Run();
  P()->SetIdent("two");
  ASSERT_NE(P()->Start(), 0);  // has no effect while it runs
  ASSERT_TRUE(P().WriteNumber("SP_Gap", 11));
  ASSERT_TRUE(P().WriteFlag("SP_Done", 1));
  EXPECT_EQ(host_.Storage().Dump(), "one gap = 11\n");
  P()->Stop();
  ASSERT_NE(P()->Start(), 0);
  ASSERT_TRUE(P().WriteFlag("SP_Done", 1));
  EXPECT_EQ(host_.Storage().Dump(), "one gap = 11\ntwo gap = 11\n");
}

// The console changes what runs, not what is active; SP_Done runs with the active values again.
TEST_F(StoredOverridesTest, DoneTakesTheConsolesChangesBack) {
  Run("rx_prefix=02 rx_suffix=03 tx_prefix=04 tx_suffix=05 gap=70");
  for (const char* command : {"set_rxPrefix 0A", "set_rxSuffix 0B", "set_txPrefix 0C",
                              "set_txSuffix 0D", "set_rxGap 20", "set_hexToken ON"}) {
    Console(command);
  }
  EXPECT_TRUE(P().WriteText("tx_token", "41"));
  EXPECT_EQ(Calls(), "queue.Lock\nSend 0C 41 0D\nqueue.Unlock\n");
  Receive("\x0A\x41\x0B");
  EXPECT_NE(Calls().find("Receive 20 -> 0A"), std::string::npos);
  EXPECT_EQ(P().TakeTokens(), "[41]");

  ASSERT_TRUE(P().WriteFlag("SP_Done", 1));
  Calls();
  EXPECT_TRUE(P().WriteText("tx_token", "A"));
  EXPECT_EQ(Calls(), "queue.Lock\nSend 04 41 05\nqueue.Unlock\n");
  Receive("\x02\x41\x03");
  EXPECT_NE(Calls().find("Receive 70 -> 02"), std::string::npos);
  EXPECT_EQ(P().TakeTokens(), "[A]");
  EXPECT_EQ(host_.Storage().Dump(), "");
}

}  // namespace
