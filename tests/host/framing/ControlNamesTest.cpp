// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "host/framing/ConfigNumber.h"
#include "host/framing/ControlNames.h"
#include "host/framing/FramingSettings.h"

namespace {

std::string Bytes(const std::string& text) {
  std::string bytes;
  std::string error;
  return ParseControlText(text, &bytes, &error) ? bytes : error;
}

TEST(ControlNames, HexadecimalText) {
  EXPECT_EQ(Bytes("0202"), "\x02\x02");
  EXPECT_EQ(Bytes("0d0A"), "\r\n");
  EXPECT_EQ(Bytes("0x03"), "\x03");
  EXPECT_EQ(Bytes("FF"), "\xFF");
  EXPECT_EQ(Bytes("ff"), "\xFF");
  EXPECT_EQ(Bytes(""), "");
}

TEST(ControlNames, Names) {
  EXPECT_EQ(Bytes("STX"), "\x02");
  EXPECT_EQ(Bytes("etx"), "\x03");
  EXPECT_EQ(Bytes("<CR>"), "\r");
  EXPECT_EQ(Bytes("CRLF"), "\r\n");
  EXPECT_EQ(Bytes("NUL"), std::string(1, '\0'));
  EXPECT_EQ(Bytes("US"), "\x1F");
  EXPECT_EQ(Bytes("DEL"), "\x7F");
  EXPECT_EQ(Bytes("TAB"), "\t");
  EXPECT_EQ(Bytes("none"), "");
}

TEST(ControlNames, RowsOfBoth) {
  EXPECT_EQ(Bytes("03+CRLF"), "\x03\r\n");
  EXPECT_EQ(Bytes("CR, LF  03"), "\r\n\x03");
}

TEST(ControlNames, AnythingElseIsRefused) {
  std::string bytes = "kept";
  std::string error;
  for (const char* const text : {"2", "STXX", "0x", "abc", "STX 0", "<>", "02 03 no"}) {
    error.clear();
    EXPECT_FALSE(ParseControlText(text, &bytes, &error)) << text;
    EXPECT_NE(error.find("neither pairs of hexadecimal digits"), std::string::npos) << text;
  }
  EXPECT_EQ(bytes, "kept");
}

TEST(ControlNames, EveryNameThatIsShownCanBeReadExceptFormFeed) {
  for (int code = 0; code < 256; ++code) {
    const auto byte = static_cast<unsigned char>(code);
    const std::string name(ControlName(byte));
    EXPECT_EQ(!name.empty(), code < 32 || code == 127) << code;
    if (!name.empty() && name != "FF") {
      EXPECT_EQ(Bytes(name), std::string(1, static_cast<char>(byte))) << name;
    }
  }
}

TEST(FramingSettings, HexTextOfTheDriver) {
  EXPECT_EQ(BytesOfHexText("none"), "");
  EXPECT_EQ(BytesOfHexText("0d0A"), "\r\n");
  // 'g' counts 16, one too many for half a byte; the zero character behind "7" counts 169.
  EXPECT_EQ(BytesOfHexText("0g"), "\x10");
  EXPECT_EQ(BytesOfHexText("7"), "\x19");
  for (const char* const text : {"", "none", "0a1B"}) {
    EXPECT_TRUE(IsHexText(text)) << text;
  }
  for (const char* const text : {"0g", "abc", "None", " 02"}) {
    EXPECT_FALSE(IsHexText(text)) << text;
  }
}

TEST(FramingSettings, FromAConfiguration) {
  const FramingSettings settings = FramingOfConfiguration(
      "CfgVer=1 rx_prefix=0202 rx_suffix=none tx_suffix=0D0a gap=0x10 hex_tokens=true "
      "token_queue_size=7");
  EXPECT_EQ(settings.rxPrefix, "\x02\x02");
  EXPECT_EQ(settings.rxSuffix, "");
  EXPECT_EQ(settings.txPrefix, "");
  EXPECT_EQ(settings.txSuffix, "\r\n");
  EXPECT_EQ(settings.gapMs, 16);
  EXPECT_EQ(settings.SilenceMs(), 16);
  EXPECT_TRUE(settings.isHex);
  EXPECT_EQ(settings.queueTokens, 7);
  EXPECT_EQ(FramingOfConfiguration("CfgVer=1 model=1"), FramingSettings());
  EXPECT_EQ(FramingSettings().SilenceMs(), 500);
}

TEST(ConfigNumber, IsReadAsTheDriverDoes) {
  EXPECT_EQ(ParseConfigNumber("9600").value, 9600);
  EXPECT_EQ(ParseConfigNumber("0x10").value, 16);
  EXPECT_EQ(ParseConfigNumber("0x10").base, 16);
  EXPECT_EQ(ParseConfigNumber("010").value, 8);
  EXPECT_EQ(ParseConfigNumber("010").base, 8);
  EXPECT_EQ(ParseConfigNumber("-5").value, -5);
  EXPECT_EQ(ParseConfigNumber("99999999999").value, 2147483647);
  EXPECT_TRUE(ParseConfigNumber("50ms").hasRest);
  EXPECT_EQ(ParseConfigNumber("50ms").value, 50);
  EXPECT_FALSE(ParseConfigNumber("abc").isNumber);
  EXPECT_FALSE(ParseConfigNumber("").isNumber);
  EXPECT_EQ(ParseConfigNumber("0").base, 10);
}

}  // namespace
