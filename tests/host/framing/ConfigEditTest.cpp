// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <fstream>

#include "host/framing/ConfigEdit.h"
#include "host/framing/ConfigReport.h"
#include "host/framing/ConfigText.h"
#include "tests/host/support/TemporaryFolder.h"

namespace {

std::string Notes(const std::string& more) {
  std::string text;
  for (const std::string& note :
       ConfigNotes("CfgVer=1 model=1 port=com1 baudrate=9600 parity=even bits=8 stopbits=1 "
                   "mode=RS-232 " +
                   more)) {
    text += note + "\n";
  }
  return text;
}

TEST(ConfigEdit, ReplacesTheValueThatCounts) {
  EXPECT_EQ(WithConfigValue("CfgVer=1 a=1 xgap=2 gap=3 gap=4", "gap", "9"),
            "CfgVer=1 a=1 xgap=2 gap=9 gap=4");
  EXPECT_EQ(WithConfigValue("CfgVer=1gap=3", "gap", "9"), "CfgVer=1gap=9");
  EXPECT_EQ(WithConfigValue("CfgVer=1 gap=", "gap", "9"), "CfgVer=1 gap=9");
}

TEST(ConfigEdit, AddsToTheSectionOfVersion1) {
  EXPECT_EQ(WithConfigValue("CfgVer=1 a=1", "gap", "9"), "CfgVer=1 a=1 gap=9");
  EXPECT_EQ(WithConfigValue("CfgVer=2 gap=1 CfgVer=1 a=1 CfgVer=3 gap=2", "gap", "9"),
            "CfgVer=2 gap=1 CfgVer=1 a=1 gap=9 CfgVer=3 gap=2");
  EXPECT_EQ(WithConfigValue("", "gap", "9"), "CfgVer=1 gap=9");
  EXPECT_EQ(WithConfigValue("CfgVer=1 a=1\n", "gap", "9"), "CfgVer=1 a=1 gap=9");
}

TEST(ConfigEdit, WhatWasPutInIsFound) {
  for (const char* const text : {"", "CfgVer=1", "CfgVer=1 gap=1", "CfgVer=1\ngap=1\nCfgVer=2",
                                 "CfgVer=1xgap=1 CfgVer=1 gap=2"}) {
    EXPECT_EQ(ConfigValue(WithConfigValue(text, "gap", "77"), "gap", ""), "77") << text;
  }
}

TEST(ConfigEdit, ReadsTextAndFile) {
  const TemporaryFolder folder;
  std::ofstream(folder.File("good")) << "CfgVer=1\nmodel=1\n";
  std::ofstream(folder.File("zero"), std::ios::binary) << std::string("CfgVer=1\0", 9);
  std::string text;
  std::string error;
  EXPECT_TRUE(ReadConfiguration("CfgVer=1 model=1", &text, &error));
  EXPECT_EQ(text, "CfgVer=1 model=1");
  EXPECT_TRUE(ReadConfiguration(folder.File("good"), &text, &error)) << error;
  EXPECT_EQ(text, "CfgVer=1\nmodel=1");
  EXPECT_FALSE(ReadConfiguration(folder.File("zero"), &text, &error));
  EXPECT_NE(error.find("zero byte"), std::string::npos);
  EXPECT_FALSE(ReadConfiguration(folder.File("none"), &text, &error));
  EXPECT_NE(error.find("No such file"), std::string::npos);
  std::ofstream(folder.File("long")) << std::string(1024 * 1024 + 1, 'a');
  EXPECT_FALSE(ReadConfiguration(folder.File("long"), &text, &error));
  EXPECT_NE(error.find("longer than any configuration"), std::string::npos);
}

TEST(ConfigNotes, NothingToSayAboutAPlainConfiguration) {
  EXPECT_EQ(Notes(""), "");
  EXPECT_EQ(Notes("gap=20 rx_prefix=02 hex_tokens=true Node1::model=1"), "");
}

TEST(ConfigNotes, TheGapEndsSuffixFramingToo) {
  EXPECT_EQ(Notes("rx_suffix=0D"),
            "gap: a silence of 500 ms in front of the suffix drops the token; a longer gap allows "
            "slow lines\n");
}

TEST(ConfigNotes, ShortGaps) {
  EXPECT_NE(Notes("gap=2").find("2 ms is shorter than two characters at 9600 baud"),
            std::string::npos);
  EXPECT_EQ(Notes("gap=3"), "");
  EXPECT_NE(Notes("gap=-1").find("a port waits 1 ms at least"), std::string::npos);
}

TEST(ConfigNotes, PrefixThatOverlapsItself) {
  EXPECT_NE(Notes("rx_prefix=0202").find("overlaps itself"), std::string::npos);
  EXPECT_NE(Notes("rx_prefix=020302").find("overlaps itself"), std::string::npos);
  EXPECT_EQ(Notes("rx_prefix=0203"), "");
}

TEST(ConfigNotes, KeysThatNobodyReads) {
  EXPECT_EQ(Notes("rx_sufix=03"), "rx_sufix: no key of this driver, ignored; meant rx_suffix?\n");
  EXPECT_EQ(Notes("Gap=03"), "Gap: no key of this driver, ignored; meant gap?\n");
  EXPECT_EQ(Notes("colour=red"), "colour: no key of this driver, ignored\n");
  EXPECT_EQ(Notes("Node1::gap=3"), "Node1::gap: ignored, only model may be set for a node\n");
  EXPECT_EQ(Notes("port=com2"), "port: stands here more than once, the first one counts\n");
  EXPECT_NE(Notes("words").find("\"words\" is no key=value"), std::string::npos);
}

TEST(ConfigNotes, NumbersThatAreReadOtherwise) {
  EXPECT_NE(Notes("gap=ten").find("gap=ten: no number, the driver reads 0"), std::string::npos);
  EXPECT_NE(Notes("gap=050").find("gap=050: read as 40"), std::string::npos);
  EXPECT_NE(Notes("gap=50ms").find("gap=50ms: read as 50"), std::string::npos);
}

TEST(ConfigNotes, WhatTheDriverTakesAndDoesNotOffer) {
  const auto notes = ConfigNotes("CfgVer=1 parity=mark baudrate=0x2580 bits=9");
  ASSERT_EQ(notes.size(), 2U);  // 0x2580 is 9600
  EXPECT_EQ(notes[0],
            "parity=mark: not among what the driver's description offers (none, even, odd); the "
            "driver also takes mark");
  EXPECT_NE(notes[1].find("bits=9: not among"), std::string::npos);
}

TEST(ConfigLine, InOneLine) {
  EXPECT_EQ(
      ConfigLine("CfgVer=1 rx_prefix=02 rx_suffix=03 tx_suffix=0d0a", "com1,9600,even,7,1,RS-232"),
      "com1 9600 7E1 RS-232  rx 02…03  tx …0D0A  gap 0 (500 ms)  queue 100");
  EXPECT_EQ(ConfigLine("CfgVer=1 port=com2 baudrate=0x2580 parity=odd bits=8 stopbits=2 "
                       "mode=RS-485 gap=20 hex_tokens=true autoConnect=false token_queue_size=5",
                       ""),
            "com2 9600 8O2 RS-485  rx by silence  tx bare  gap 20 ms  queue 5  hex tokens  closed "
            "at start");
}

TEST(ConfigTable, EveryKeyWithValueDefaultAndMeaning) {
  const auto lines = ConfigTable("CfgVer=1 port=com2 rx_suffix=03");
  ASSERT_EQ(lines.size(), 16U);
  EXPECT_EQ(lines[2].substr(0, 47), "port=com2               given (default com1); c");
  EXPECT_NE(lines[3].find("MISSING (default 9600)"), std::string::npos);
  EXPECT_NE(lines[10].find("gap=0                   default; a number; silence in ms"),
            std::string::npos);
}

}  // namespace
