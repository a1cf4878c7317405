// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "host/instance/SettingTable.h"

namespace {

std::string Parsed(const char* key, const std::string& value) {
  std::string tagValue;
  std::string error;
  return ParseSetting(*FindSetting(key), value, &tagValue, &error) ? tagValue : "error: " + error;
}

TEST(SettingTable, FindsASettingUnderAllItsNames) {
  EXPECT_EQ(FindSetting("baud"), FindSetting("baudrate"));
  EXPECT_EQ(FindSetting("stop"), FindSetting("stopbits"));
  EXPECT_EQ(FindSetting("baud"), FindSettingOfMemoryType("SP_Baud"));
  EXPECT_EQ(FindSetting("port"), nullptr);
  EXPECT_EQ(FindSettingOfMemoryType("SP_Done"), nullptr);
  EXPECT_EQ(TagUri(*FindSetting("gap")), "0?SP_Gap?unsignedInt");
}

TEST(SettingTable, ReadsWhatPeopleWrite) {
  EXPECT_EQ(Parsed("baud", "115200"), "115200");
  EXPECT_EQ(Parsed("parity", "even"), "1");
  EXPECT_EQ(Parsed("parity", "space"), "4");
  EXPECT_EQ(Parsed("parity", "4"), "4");
  EXPECT_EQ(Parsed("bits", "7"), "7");
  EXPECT_EQ(Parsed("stop", "2"), "2");
  EXPECT_EQ(Parsed("mode", "RS-422"), "2");
  EXPECT_EQ(Parsed("rx_prefix", "02fF"), "02fF");
  EXPECT_EQ(Parsed("rx_prefix", "none"), "none");
  EXPECT_EQ(Parsed("rx_prefix", ""), "");
  EXPECT_EQ(Parsed("hex_tokens", "on"), "1");
  EXPECT_EQ(Parsed("hex_tokens", "false"), "0");
  EXPECT_EQ(Parsed("gap", "2147483647"), "2147483647");
}

TEST(SettingTable, SaysWhatIsAllowed) {
  EXPECT_EQ(Parsed("baud", "115000"),
            "error: baud is 150, 300, 600, 1200, 2400, 4800, 9600, 19200, 38400, 57600 or 115200, "
            "not \"115000\"");
  EXPECT_EQ(Parsed("parity", "5"), "error: parity is none, even, odd, mark or space, not \"5\"");
  EXPECT_EQ(Parsed("bits", "6"), "error: bits is 7 or 8, not \"6\"");
  EXPECT_EQ(Parsed("stop", "3"), "error: stop is 1 or 2, not \"3\"");
  EXPECT_EQ(Parsed("mode", "3"), "error: mode is RS-232, RS-485 or RS-422, not \"3\"");
  EXPECT_EQ(Parsed("rx_suffix", "0D0"),
            "error: rx_suffix is an even number of hexadecimal digits or none, not \"0D0\"");
  EXPECT_EQ(Parsed("hex_tokens", "yes"), "error: hex_tokens is true or false, not \"yes\"");
  EXPECT_EQ(Parsed("gap", "2147483648"), "error: gap is a number, not \"2147483648\"");
  EXPECT_EQ(Parsed("gap", "-1"), "error: gap is a number, not \"-1\"");
}

TEST(SettingTable, ShowsWhatTheTagHolds) {
  EXPECT_EQ(ShowSetting(*FindSetting("parity"), "3"), "mark");
  EXPECT_EQ(ShowSetting(*FindSetting("parity"), "9"), "9");
  EXPECT_EQ(ShowSetting(*FindSetting("rx_prefix"), ""), "none");
  EXPECT_EQ(ShowSetting(*FindSetting("rx_prefix"), "0d0a"), "0D0A");
  EXPECT_EQ(ShowSetting(*FindSetting("hex_tokens"), "1"), "true");
  EXPECT_EQ(ShowStored(*FindSetting("hex_tokens"), StoredValue(true)), "true");
  EXPECT_EQ(ShowStored(*FindSetting("baud"), StoredValue(9600)), "9600");
  EXPECT_EQ(ShowStored(*FindSetting("tx_suffix"), StoredValue(std::string("0a"))), "0A");
}

}  // namespace
