// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <nlohmann/json.hpp>

#include "host/commands/SettingText.h"
#include "host/commands/SettingWord.h"
#include "host/commands/TextTable.h"

namespace {

std::string TagValue(const std::string& word) {
  SettingWord setting;
  std::string error;
  return ParseSettingWord(word, &setting, &error) ? setting.tagValue : "error: " + error;
}

StoredValue Stored(const std::string& word) {
  SettingWord setting;
  std::string error;
  EXPECT_TRUE(ParseSettingWord(word, &setting, &error)) << error;
  return StoredValueOf(setting);
}

TEST(SettingWord, TakesNamesOfControlBytes) {
  EXPECT_EQ(TagValue("rx_prefix=STX"), "02");
  EXPECT_EQ(TagValue("rx_suffix=CR LF"), "0D0A");
  EXPECT_EQ(TagValue("tx_suffix=0d0a"), "0D0A");
  EXPECT_EQ(TagValue("tx_prefix=FF"), "FF");
  EXPECT_EQ(TagValue("rx_prefix="), "none");
  EXPECT_EQ(TagValue("rx_prefix=none"), "none");
  EXPECT_EQ(TagValue("rx_prefix=0").substr(0, 18), "error: rx_prefix: ");
}

TEST(SettingWord, TakesNamesOfTheConfiguration) {
  EXPECT_EQ(TagValue("baudrate=9600"), "9600");
  EXPECT_EQ(TagValue("parity=mark"), "3");
  EXPECT_EQ(TagValue("mode=RS-485"), "1");
  EXPECT_EQ(TagValue("hex_tokens=off"), "0");
}

TEST(SettingWord, RefusesTheRest) {
  EXPECT_EQ(TagValue("baud"), "error: expected KEY=VALUE, not \"baud\"");
  EXPECT_EQ(TagValue("=5").substr(0, 37), "error: no setting \"\"; there are baud,");
  EXPECT_EQ(TagValue("gap=five"), "error: gap is a number, not \"five\"");
}

TEST(SettingWord, IsStoredWithTheKindThatTheDriverReads) {
  EXPECT_EQ(Stored("parity=even"), StoredValue(1));
  EXPECT_EQ(Stored("gap=2147483647"), StoredValue(2147483647));
  EXPECT_EQ(Stored("hex_tokens=on"), StoredValue(true));
  EXPECT_EQ(Stored("rx_suffix=CR"), StoredValue(std::string("0D")));
}

TEST(SettingText, StandsInTheOrderOfTheTable) {
  EXPECT_EQ(StagedText({{{"key", "gap"}, {"value", "5"}, {"active", "0"}},
                        {{"key", "baud"}, {"value", "300"}, {"active", "9600"}}}),
            "staged: baud 300 (active 9600), gap 5 (active 0)");
}

TEST(SettingText, SaysWhatDoneDid) {
  const nlohmann::json applied = {{{"key", "gap"}, {"value", "5"}, {"previous", "0"}}};
  EXPECT_EQ(AppliedText({{"applied", applied}, {"stored", true}, {"cleared", 0}}),
            "applied and stored");
  EXPECT_EQ(AppliedText({{"applied", applied}, {"stored", false}, {"cleared", 2}}),
            "applied, not stored; 2 waiting tokens cleared");
  EXPECT_EQ(AppliedText({{"applied", nlohmann::json::array()}, {"stored", true}, {"cleared", 1}}),
            "nothing was staged; 1 waiting token cleared");
  EXPECT_EQ(AlsoAppliedText({{"applied", applied}}, {}), "gap 5 (was 0)");
  EXPECT_EQ(AlsoAppliedText({{"applied", applied}}, {"gap"}), "");
}

TEST(TextTable, AlignsColumnsWithoutBlanksAtTheEnd) {
  EXPECT_EQ(TextTable({{"a", "bb"}, {"ccc", ""}, {"d"}}), "a    bb\nccc\nd\n");
}

}  // namespace
