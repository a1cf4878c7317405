// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <cstring>
#include <string>

#include "driver/HexText.h"

namespace {

std::string OneByte(int value) {
  return std::string(1, static_cast<char>(static_cast<unsigned char>(value)));
}

// The value of a character as the conversion counts it.
int NibbleOf(int code) {
  if (code >= '0' && code <= '9') return code - '0';
  if (code >= 'A' && code <= 'F') return code - 'A' + 10;
  return (code - 87 + 256) % 256;
}

}  // namespace

TEST(HexTextTest, IsHexExamples) {
  EXPECT_TRUE(isHex("0a1B"));
  EXPECT_FALSE(isHex("0g"));
  EXPECT_FALSE(isHex("abc"));
  EXPECT_TRUE(isHex(""));
  EXPECT_TRUE(isHex("none"));
}

TEST(HexTextTest, OnlyTheExactWordIsNone) {
  for (const char* text : {"None", "NONE", "none ", " none", "nonenone", "no"}) {
    EXPECT_FALSE(isHex(text)) << text;
  }
}

TEST(HexTextTest, NoTextIsNotHex) { EXPECT_FALSE(isHex(nullptr)); }

TEST(HexTextTest, EveryCharacterInEachPlace) {
  for (int code = 1; code < 256; ++code) {
    const char c = static_cast<char>(static_cast<unsigned char>(code));
    const bool isDigit = std::strchr("0123456789ABCDEFabcdef", code) != nullptr;
    EXPECT_EQ(isHex((std::string(1, c) + "0").c_str()), isDigit) << code;
    EXPECT_EQ(isHex((std::string("0") + c).c_str()), isDigit) << code;
    EXPECT_EQ(isHex((std::string("000") + c).c_str()), isDigit) << code;
  }
}

TEST(HexTextTest, OddLengthsAreNotHex) {
  EXPECT_FALSE(isHex("0"));
  EXPECT_FALSE(isHex("2"));
  EXPECT_FALSE(isHex(std::string(9999, '0').c_str()));
  EXPECT_TRUE(isHex(std::string(10000, '0').c_str()));
}

TEST(HexTextTest, FromHexExamples) {
  EXPECT_EQ(fromHex("none"), "");
  EXPECT_EQ(fromHex(""), "");
  EXPECT_EQ(fromHex("0d0A"), "\x0D\x0A");
  EXPECT_EQ(fromHex("414243"), "ABC");
  EXPECT_EQ(fromHex("00"), std::string(1, '\0'));
}

TEST(HexTextTest, FromHexOfEveryByteInBothCases) {
  for (int value = 0; value < 256; ++value) {
    char upper[3];
    char lower[3];
    std::snprintf(upper, sizeof upper, "%02X", static_cast<unsigned int>(value));
    std::snprintf(lower, sizeof lower, "%02x", static_cast<unsigned int>(value));
    EXPECT_EQ(fromHex(upper), OneByte(value));
    EXPECT_EQ(fromHex(lower), OneByte(value));
    EXPECT_EQ(ToHex(OneByte(value)), upper);
  }
}

TEST(HexTextTest, FromHexOfAnyTwoCharacters) {
  for (int high = 0; high < 256; ++high) {
    for (int low = 0; low < 256; ++low) {
      const std::string text = OneByte(high) + OneByte(low);
      ASSERT_EQ(fromHex(text), OneByte((NibbleOf(high) * 16 + NibbleOf(low)) % 256))
          << high << " " << low;
    }
  }
}

TEST(HexTextTest, LastCharacterOfAnOddLengthIsPairedWithAZero) {
  EXPECT_EQ(fromHex("0"), OneByte(169));
  EXPECT_EQ(fromHex("1"), OneByte(16 + 169));
  EXPECT_EQ(fromHex("41a"), "A" + OneByte(160 + 169));
}

TEST(HexTextTest, NoneInsideATextIsNoWord) {
  EXPECT_EQ(fromHex("None").size(), 2U);
  EXPECT_EQ(fromHex("nonenone").size(), 4U);
}

TEST(HexTextTest, ToHexAndBack) {
  std::string all;
  for (int value = 0; value < 256; ++value) all += OneByte(value);
  EXPECT_EQ(ToHex(all).size(), 512U);
  EXPECT_TRUE(isHex(ToHex(all).c_str()));
  EXPECT_EQ(fromHex(ToHex(all)), all);
  EXPECT_EQ(ToHex(""), "");
  EXPECT_EQ(ToHex("AB"), "4142");
}
