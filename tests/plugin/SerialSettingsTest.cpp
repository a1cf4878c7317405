// SPDX-License-Identifier: Apache-2.0
// Run-time serial settings: staging, applying with SP_Done, keeping in permanent storage.
#include "tests/plugin/PluginFixture.h"

namespace {

class SerialSettingsTest : public ProtocolFixture {
 protected:
  void Done() { EXPECT_TRUE(P().WriteFlag("SP_Done", 1)) << P().Error(); }
  void StageEverything() {
    EXPECT_TRUE(P().WriteNumber("SP_Baud", 19200));
    EXPECT_TRUE(P().WriteByte("SP_Bits", 7));
    EXPECT_TRUE(P().WriteByte("SP_Stop", 2));
    EXPECT_TRUE(P().WriteByte("SP_Par", 2));
    EXPECT_TRUE(P().WriteByte("SP_Mode", 1));
    EXPECT_TRUE(P().WriteText("SP_RxPrefix", "02"));
    EXPECT_TRUE(P().WriteText("SP_RxSuffix", "03"));
    EXPECT_TRUE(P().WriteNumber("SP_Gap", 70));
    EXPECT_TRUE(P().WriteText("SP_TxPrefix", "0d"));
    EXPECT_TRUE(P().WriteText("SP_TxSuffix", "none"));
    EXPECT_TRUE(P().WriteFlag("SP_HexTokens", 1));
    EXPECT_TRUE(P().WriteNumber("SP_TokenQueueSize", 5));
  }
  // Whether a write fails and leaves the error state as it was.
  template <class Write>
  bool FailsInSilence(Write write) {
    EXPECT_EQ(P()->createAlarm("x"), nullptr);
    const bool failed = !write();
    return failed && P().Error() == "-1 protocol does not support alarms";
  }
};

TEST_F(SerialSettingsTest, NothingBeforeStart) {
  ASSERT_TRUE(P().Config(Mandatory()));
  EXPECT_FALSE(P().WriteNumber("SP_Baud", 9600));
  EXPECT_EQ(P().Error(), "-3 Protocol not started");
  EXPECT_FALSE(P().WriteFlag("SP_Done", 1));
  EXPECT_EQ(P().Error(), "-3 Protocol not started");
  EXPECT_EQ(Calls(), "");
}

TEST_F(SerialSettingsTest, StagingAndReadingBackTakesNoSemaphoreAndChangesNothing) {
  Run();
  StageEverything();
  EXPECT_EQ(P().ReadNumber("SP_Baud"), 19200U);
  EXPECT_EQ(P().ReadByte("SP_Bits"), 7U);
  EXPECT_EQ(P().ReadByte("SP_Stop"), 2U);
  EXPECT_EQ(P().ReadByte("SP_Par"), 2U);
  EXPECT_EQ(P().ReadByte("SP_Mode"), 1U);
  EXPECT_EQ(P().ReadText("SP_RxPrefix"), "02");
  EXPECT_EQ(P().ReadText("SP_RxSuffix"), "03");
  EXPECT_EQ(P().ReadNumber("SP_Gap"), 70U);
  EXPECT_EQ(P().ReadText("SP_TxPrefix"), "0d");
  EXPECT_EQ(P().ReadText("SP_TxSuffix"), "none");
  EXPECT_TRUE(P().ReadFlag("SP_HexTokens"));
  EXPECT_EQ(P().ReadNumber("SP_TokenQueueSize"), 5U);
  EXPECT_FALSE(P().ReadFlag("SP_Done"));
  EXPECT_EQ(Calls(), "");
  EXPECT_EQ(P().ComParams(), "com1,9600,even,8,1,RS-232");
  EXPECT_EQ(host_.Storage().Dump(), "");
}

TEST_F(SerialSettingsTest, DoneAppliesAndStoresEverythingInKeyOrder) {
  Run();
  StageEverything();
  Done();
  EXPECT_EQ(Calls(),
            "queue.Lock\n"
            "SetInteger LOKA baud 19200\n"
            "SetInteger LOKA bits 7\n"
            "SetInteger LOKA gap 70\n"
            "SetBoolean LOKA hex_tokens true\n"
            "SetInteger LOKA mode 1\n"
            "SetInteger LOKA parity 2\n"
            "SetString LOKA rx_prefix 02\n"
            "SetString LOKA rx_suffix 03\n"
            "SetInteger LOKA stop 2\n"
            "SetInteger LOKA token_queue_size 5\n"
            "SetString LOKA tx_prefix 0d\n"
            "SetString LOKA tx_suffix none\n"
            "Setup 19200 2 7 2 1\n"
            "queue.Unlock\n");
  EXPECT_EQ(P().ComParams(), "com1,19200,odd,7,2,RS-485");
}

TEST_F(SerialSettingsTest, DoneWithNothingStagedOnlyEmptiesTheQueue) {
  Run("rx_suffix=03");
  Receive(
      "A\x03"
      "B\x03");
  EXPECT_EQ(P().ReadNumber("tokens_available"), 2U);
  Calls();
  Done();
  EXPECT_EQ(Calls(), "queue.Lock\nqueue.Unlock\n");
  EXPECT_EQ(P().ReadNumber("tokens_available"), 0U);
}

TEST_F(SerialSettingsTest, DoneDoesItsWorkForAnyValue) {
  Run();
  ASSERT_TRUE(P().WriteNumber("SP_Baud", 300));
  EXPECT_TRUE(P().WriteFlag("SP_Done", 0));
  EXPECT_EQ(P().ComParams(), "com1,300,even,8,1,RS-232");
}

TEST_F(SerialSettingsTest, DoneIsQuietAboutThePortWhenNoneOfTheFiveChanged) {
  Run();
  ASSERT_TRUE(P().WriteNumber("SP_Baud", 9600));
  ASSERT_TRUE(P().WriteByte("SP_Par", 1));
  ASSERT_TRUE(P().WriteNumber("SP_Gap", 9));
  ASSERT_TRUE(P().WriteText("SP_RxPrefix", "02"));
  Done();
  EXPECT_EQ(Calls(),
            "queue.Lock\nSetInteger LOKA baud 9600\nSetInteger LOKA gap 9\n"
            "SetInteger LOKA parity 1\nSetString LOKA rx_prefix 02\nqueue.Unlock\n");
}

TEST_F(SerialSettingsTest, StagedValuesStayAndAreStoredAgain) {
  Run();
  ASSERT_TRUE(P().WriteNumber("SP_Baud", 300));
  Done();
  EXPECT_EQ(Calls(), "queue.Lock\nSetInteger LOKA baud 300\nSetup 300 1 8 1 0\nqueue.Unlock\n");
  Done();
  EXPECT_EQ(Calls(), "queue.Lock\nSetInteger LOKA baud 300\nqueue.Unlock\n");
}

TEST_F(SerialSettingsTest, TheLastStagedValueCounts) {
  Run();
  ASSERT_TRUE(P().WriteNumber("SP_Baud", 300));
  ASSERT_TRUE(P().WriteNumber("SP_Baud", 600));
  EXPECT_EQ(P().ReadNumber("SP_Baud"), 600U);
  Done();
  EXPECT_EQ(Calls(), "queue.Lock\nSetInteger LOKA baud 600\nSetup 600 1 8 1 0\nqueue.Unlock\n");
}

TEST_F(SerialSettingsTest, EachOfTheFiveSetsThePortUp) {
  Run();
  ASSERT_TRUE(P().WriteByte("SP_Par", 4));
  Done();
  EXPECT_EQ(host_.Log().Count("Setup 9600 4 8 1 0"), 1);
  ASSERT_TRUE(P().WriteByte("SP_Bits", 7));
  Done();
  EXPECT_EQ(host_.Log().Count("Setup 9600 4 7 1 0"), 1);
  ASSERT_TRUE(P().WriteByte("SP_Stop", 2));
  Done();
  EXPECT_EQ(host_.Log().Count("Setup 9600 4 7 2 0"), 1);
  ASSERT_TRUE(P().WriteByte("SP_Mode", 2));
  Done();
  EXPECT_EQ(host_.Log().Count("Setup 9600 4 7 2 2"), 1);
  ASSERT_TRUE(P().WriteNumber("SP_Baud", 115200));
  Done();
  EXPECT_EQ(host_.Log().Count("Setup 115200 4 7 2 2"), 1);
  EXPECT_EQ(P().ComParams(), "com1,115200,space,7,2,RS-422");
}

// Bits and stop bits that differ from each other: neither takes the other's value when only one of
// the settings was staged.
TEST_F(SerialSettingsTest, BitsKeepTheirValueWhenOnlyOthersAreStaged) {
  Run();
  ASSERT_TRUE(P().WriteByte("SP_Stop", 2));
  Done();
  EXPECT_EQ(P().ComParams(), "com1,9600,even,8,2,RS-232");
}

TEST_F(SerialSettingsTest, ASetupThatFailsIsIgnored) {
  Run();
  ASSERT_TRUE(P().WriteNumber("SP_Baud", 300));
  host_.Faults().FailAlways("Setup");
  Done();
  EXPECT_TRUE(P().ReadFlag("connect"));
  EXPECT_EQ(P().ComParams(), "com1,300,even,8,1,RS-232");
  EXPECT_EQ(P().Error(), "1 ");
}

TEST_F(SerialSettingsTest, AClosedPortIsSetUpByTheNextConnect) {
  Run("autoConnect=false");
  StageEverything();
  Done();
  EXPECT_EQ(Calls().find("Setup"), std::string::npos);
  EXPECT_EQ(P().ComParams(), "com1,19200,odd,7,2,RS-485");
  EXPECT_TRUE(P().WriteFlag("connect", 1));
  EXPECT_EQ(Calls(),
            "queue.Lock\nport.Lock\nOpenPort com1\nSetup 19200 2 7 2 1\nport.Unlock\n"
            "queue.Unlock\n");
}

TEST_F(SerialSettingsTest, FramingAndHexModeApply) {
  Run();
  StageEverything();
  Done();
  Calls();
  EXPECT_TRUE(P().WriteText("tx_token", "4142"));
  EXPECT_EQ(Calls(), "queue.Lock\nSend 0D 41 42\nqueue.Unlock\n");
  Receive("\x02\xAB\x03");
  EXPECT_EQ(P().TakeTokens(), "[AB]");
}

TEST_F(SerialSettingsTest, AcceptedBaudRates) {
  Run();
  for (const unsigned rate :
       {150U, 300U, 600U, 1200U, 2400U, 4800U, 9600U, 19200U, 38400U, 57600U, 115200U}) {
    EXPECT_TRUE(P().WriteNumber("SP_Baud", rate)) << rate;
    EXPECT_EQ(P().ReadNumber("SP_Baud"), rate);
  }
}

TEST_F(SerialSettingsTest, RefusedBaudRates) {
  Run();
  ASSERT_TRUE(P().WriteNumber("SP_Baud", 600));
  for (const unsigned rate :
       {0U, 1U, 110U, 149U, 151U, 14400U, 115000U, 115201U, 230400U, 0xFFFFFFFFU, 0x80000000U}) {
    EXPECT_EQ(P()->WriteBlock(nullptr, nullptr, 0), 0);
    EXPECT_FALSE(P().WriteNumber("SP_Baud", rate)) << rate;
    EXPECT_EQ(P().Error(), "-1 illegal baudrate intValue") << rate;
    EXPECT_EQ(P().ReadNumber("SP_Baud"), 600U) << "nothing is staged";
  }
  EXPECT_EQ(Calls(), "");
}

TEST_F(SerialSettingsTest, SmallCodesAreRefusedInSilence) {
  Run();
  const struct {
    const char* type;
    unsigned lowest;
    unsigned highest;
  } rows[] = {{"SP_Par", 0, 4}, {"SP_Bits", 7, 8}, {"SP_Stop", 1, 2}, {"SP_Mode", 0, 2}};
  for (const auto& row : rows) {
    for (unsigned value = row.lowest; value <= row.highest; ++value) {
      EXPECT_TRUE(P().WriteByte(row.type, value)) << row.type << value;
      EXPECT_EQ(P().ReadByte(row.type), value);
    }
    for (unsigned value = 0; value < 256; ++value) {
      if (value >= row.lowest && value <= row.highest) continue;
      EXPECT_TRUE(FailsInSilence([&] { return P().WriteByte(row.type, value); }))
          << row.type << value;
      EXPECT_EQ(P().ReadByte(row.type), row.highest) << "nothing is staged";
    }
  }
  EXPECT_EQ(Calls(), "");
}

TEST_F(SerialSettingsTest, FramingTextsMustBeHex) {
  Run();
  const struct {
    const char* type;
    const char* error;
  } rows[] = {{"SP_RxPrefix", "-1 Rx prefix value is not hex format"},
              {"SP_RxSuffix", "-1 Rx suffix value is not hex format"},
              {"SP_TxPrefix", "-1 Tx prefix value is not hex format"},
              {"SP_TxSuffix", "-1 Tx suffix value is not hex format"}};
  for (const auto& row : rows) {
    for (const char* text : {"02", "none", "", "0d0A", "aAbBcCdDeEfF0123456789"}) {
      EXPECT_TRUE(P().WriteText(row.type, text)) << row.type << text;
      EXPECT_EQ(P().ReadText(row.type), text);
    }
    ASSERT_TRUE(P().WriteText(row.type, "77"));
    for (const char* text : {"2", "0g", "abc", "None", "0 ", " 0", "0x02", "\x80\x81", "none0"}) {
      EXPECT_EQ(P()->createAlarm("x"), nullptr);
      EXPECT_FALSE(P().WriteText(row.type, text)) << row.type << text;
      EXPECT_EQ(P().Error(), row.error);
      EXPECT_EQ(P().ReadText(row.type), "77") << "nothing is staged";
    }
  }
  EXPECT_EQ(Calls(), "");
}

TEST_F(SerialSettingsTest, ATextMayFillItsTag) {
  Run();
  EXPECT_TRUE(P().WriteText("SP_RxPrefix", "0102", 4));
  EXPECT_EQ(P().ReadText("SP_RxPrefix"), "0102");
  // Only what lies within the tag counts.
  EXPECT_TRUE(P().WriteText("SP_RxPrefix", "0304xx", 4));
  EXPECT_EQ(P().ReadText("SP_RxPrefix"), "0304");
}

TEST_F(SerialSettingsTest, TextsOfAnyLength) {
  Run();
  for (const int length : {118, 120, 122, 126, 128, 130, 254, 256, 258, 9998}) {
    std::string text;
    while (text.size() < static_cast<std::size_t>(length)) text += "4A";
    EXPECT_TRUE(P().WriteText("SP_TxPrefix", text, length)) << length;
    EXPECT_EQ(P().ReadText("SP_TxPrefix", length + 1), text);
  }
}

TEST_F(SerialSettingsTest, GapAndQueueSizeAreNotChecked) {
  Run();
  for (const unsigned value : {0U, 1U, 10001U, 0x7FFFFFFFU, 0x80000000U, 0xFFFFFFFFU}) {
    EXPECT_TRUE(P().WriteNumber("SP_Gap", value));
    EXPECT_EQ(P().ReadNumber("SP_Gap"), value);
    EXPECT_TRUE(P().WriteNumber("SP_TokenQueueSize", value));
    EXPECT_EQ(P().ReadNumber("SP_TokenQueueSize"), value);
  }
}

TEST_F(SerialSettingsTest, AnyNonZeroByteSetsHexTokens) {
  Run();
  for (const unsigned value : {1U, 2U, 0x80U, 0xFFU}) {
    EXPECT_TRUE(P().WriteFlag("SP_HexTokens", 0));
    EXPECT_FALSE(P().ReadFlag("SP_HexTokens"));
    EXPECT_TRUE(P().WriteFlag("SP_HexTokens", value));
    EXPECT_TRUE(P().ReadFlag("SP_HexTokens"));
  }
}

TEST_F(SerialSettingsTest, NotWithoutPermanentStorage) {
  plugin_.Close();
  protocol_.reset();
  host_.SetAbsent("IPermanentStorage");
  ASSERT_EQ(plugin_.Init(&host_), 1);
  protocol_ = std::make_unique<ProtocolUnderTest>(plugin_);
  ASSERT_TRUE(P().Config(Mandatory()));
  ASSERT_NE(P()->Start(), 0);
  EXPECT_FALSE(P().ReadFlag("SP_HexTokens"));
  StageEverything();
  Calls();
  Done();
  EXPECT_EQ(Calls(), "queue2.Lock\nSetup 19200 2 7 2 1\nqueue2.Unlock\n");
  EXPECT_TRUE(P().ReadFlag("SP_HexTokens"));
}

}  // namespace
