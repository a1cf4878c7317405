// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "host/instance/FramingInEffect.h"

namespace {

SettingsBook Book(const std::string& configuration) {
  SettingsBook book("CfgVer=1 " + configuration);
  for (const SettingEntry& setting : kSettingTable) {
    book.Of(setting).active = book.Of(setting).configured;
  }
  return book;
}

TEST(SettingsBook, KnowsWhatIsConfigured) {
  SettingsBook book("CfgVer=1 model=1 baudrate=0x2580 parity=odd rx_prefix=0d");
  EXPECT_EQ(book.Of(*FindSetting("baud")).configured, "9600");
  EXPECT_EQ(book.Of(*FindSetting("parity")).configured, "odd");
  EXPECT_EQ(book.Of(*FindSetting("rx_prefix")).configured, "0D");
  EXPECT_EQ(book.Of(*FindSetting("rx_suffix")).configured, "none");
  EXPECT_EQ(book.Of(*FindSetting("gap")).configured, "0");
  EXPECT_EQ(book.Of(*FindSetting("hex_tokens")).configured, "false");
  EXPECT_EQ(book.Of(*FindSetting("token_queue_size")).configured, "100");
  book.Of(*FindSetting("gap")).staged = "5";
  const SettingsBook& constant = book;
  EXPECT_EQ(constant.Of(*FindSetting("gap")).staged, "5");
  EXPECT_FALSE(constant.Of(*FindSetting("baud")).staged);
}

TEST(FramingInEffect, TakesWhatIsActive) {
  FramingInEffect framing;
  framing.OnApplied(
      Book("rx_prefix=02 rx_suffix=0D0A tx_prefix=05 tx_suffix=none gap=20 "
           "hex_tokens=true token_queue_size=7"));
  FramingSettings expected;
  expected.rxPrefix = "\x02";
  expected.rxSuffix = "\r\n";
  expected.txPrefix = "\x05";
  expected.gapMs = 20;
  expected.isHex = true;
  expected.queueTokens = 7;
  EXPECT_EQ(framing.Settings(), expected);
}

TEST(FramingInEffect, FollowsTheConsole) {
  FramingInEffect framing;
  framing.OnApplied(Book(""));
  framing.OnConsole("set_rxPrefix 02", "OK");
  framing.OnConsole("set_rxSuffix 0D extra", "OK");
  framing.OnConsole("set_txPrefix 03", "OK");
  framing.OnConsole("set_txSuffix 04", "OK");
  framing.OnConsole("set_rxGap 50ms", "OK");
  framing.OnConsole("set_hexToken ON", "OK");
  FramingSettings expected;
  expected.rxPrefix = "\x02";
  expected.rxSuffix = "\r";
  expected.txPrefix = "\x03";
  expected.txSuffix = "\x04";
  expected.gapMs = 50;
  expected.isHex = true;
  EXPECT_EQ(framing.Settings(), expected);
  framing.OnConsole("set_hexToken OFF", "OK");
  EXPECT_FALSE(framing.Settings().isHex);
  // What is applied wins over what the console changed.
  framing.OnApplied(Book(""));
  EXPECT_EQ(framing.Settings(), FramingSettings());
}

TEST(FramingInEffect, LeavesWhatTheDriverRefusedAndWhatIsNoSetting) {
  FramingInEffect framing;
  framing.OnApplied(Book("gap=9"));
  const FramingSettings before = framing.Settings();
  framing.OnConsole("set_rxGap x", "ERROR: wrong value");
  framing.OnConsole("set_rxGap", "ERROR: new value is missing");
  framing.OnConsole("set_rxGap", "OK");
  framing.OnConsole("get_stat", "Connected");
  framing.OnConsole("put set_rxGap 7", "OK");
  framing.OnConsole("", "");
  EXPECT_EQ(framing.Settings(), before);
}

}  // namespace
