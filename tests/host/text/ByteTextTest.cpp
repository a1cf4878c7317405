// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <cstdio>

#include "host/text/ByteText.h"

namespace {

std::string OneByte(int value) {
  return std::string(1, static_cast<char>(static_cast<unsigned char>(value)));
}

// Written out by hand, so that a slip in the code's tables shows.
std::string ExpectedEscape(int value) {
  switch (value) {
    case 7:
      return "\\a";
    case 8:
      return "\\b";
    case 9:
      return "\\t";
    case 10:
      return "\\n";
    case 11:
      return "\\v";
    case 12:
      return "\\f";
    case 13:
      return "\\r";
    case 34:
      return "\\\"";
    case 92:
      return "\\\\";
    default:
      break;
  }
  char text[8] = {};
  if (value < 32 || value > 126) {
    std::snprintf(text, sizeof text, "\\x%02x", static_cast<unsigned int>(value));
    return text;
  }
  return OneByte(value);
}

TEST(ByteText, EscapesEveryByteValue) {
  for (int value = 0; value < 256; ++value) {
    EXPECT_EQ(EscapeBytes(OneByte(value)), ExpectedEscape(value)) << value;
  }
}

TEST(ByteText, ShowsNothingButPrintableAscii) {
  std::string all;
  for (int value = 0; value < 256; ++value) {
    all += OneByte(value);
  }
  for (const char character : EscapeBytes(all) + HexBytes(all)) {
    EXPECT_GE(character, ' ');
    EXPECT_LE(character, '~');
  }
}

TEST(ByteText, ShowsHexOfEveryByteValueAndReadsItBack) {
  for (int value = 0; value < 256; ++value) {
    char expected[4] = {};
    std::snprintf(expected, sizeof expected, "%02X", static_cast<unsigned int>(value));
    EXPECT_EQ(HexBytes(OneByte(value)), expected);
    std::string bytes;
    ASSERT_TRUE(ParseHexBytes(expected, &bytes));
    EXPECT_EQ(bytes, OneByte(value));
  }
}

TEST(ByteText, SeparatesHexBytesByBlanks) {
  EXPECT_EQ(HexBytes("AB"), "41 42");
  EXPECT_EQ(HexBytes(""), "");
}

TEST(ByteText, ReadsHexWithAndWithoutBlanks) {
  std::string bytes = "untouched";
  EXPECT_TRUE(ParseHexBytes("", &bytes));
  EXPECT_EQ(bytes, "");
  EXPECT_TRUE(ParseHexBytes("4142 43  aF", &bytes));
  EXPECT_EQ(bytes, "ABC\xAF");
}

TEST(ByteText, RefusesWhatIsNotHex) {
  std::string bytes = "untouched";
  for (const char* const text : {"4", "414", "4 1", "4G", "g0", "-1", "0x41", "41\n"}) {
    EXPECT_FALSE(ParseHexBytes(text, &bytes)) << text;
  }
  EXPECT_EQ(bytes, "untouched");
}

}  // namespace
