// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "protlib/ProtUtilsN.h"

namespace {

std::vector<std::string> Pieces(const std::string& text, char separator) {
  std::vector<std::string> pieces;
  ProtUtilsN::ParseSubstrings(text, pieces, separator);
  return pieces;
}

using Texts = std::vector<std::string>;

}  // namespace

TEST(ProtUtilsNTextTest, TrimsSpacesAndTabsOnly) {
  EXPECT_EQ(ProtUtilsN::GetTrim(" \t a b \t "), "a b");
  EXPECT_EQ(ProtUtilsN::GetTrim("ab"), "ab");
  EXPECT_EQ(ProtUtilsN::GetTrim("\n a \r"), "\n a \r");
  EXPECT_EQ(ProtUtilsN::GetTrim(" \n "), "\n");
}

TEST(ProtUtilsNTextTest, TrimOfBlanksIsEmpty) {
  EXPECT_EQ(ProtUtilsN::GetTrim(""), "");
  EXPECT_EQ(ProtUtilsN::GetTrim(" "), "");
  EXPECT_EQ(ProtUtilsN::GetTrim("\t \t"), "");
}

TEST(ProtUtilsNTextTest, TrimWorksInPlace) {
  for (const char* text : {"", "   ", " a ", "\tb", "c d "}) {
    std::string s = text;
    ProtUtilsN::Trim(s);
    EXPECT_EQ(s, ProtUtilsN::GetTrim(text));
  }
}

TEST(ProtUtilsNTextTest, SplitsAndTrims) {
  EXPECT_EQ(Pieces("  a : b :: ", ':'), (Texts{"a", "b", "", ""}));
  EXPECT_EQ(Pieces("a,b", ','), (Texts{"a", "b"}));
  EXPECT_EQ(Pieces("a b", ','), Texts{"a b"});
}

TEST(ProtUtilsNTextTest, GivesOnePieceMoreThanSeparators) {
  EXPECT_EQ(Pieces("", ','), Texts{""});
  EXPECT_EQ(Pieces(",", ','), (Texts{"", ""}));
  EXPECT_EQ(Pieces(",,", ','), (Texts{"", "", ""}));
}

TEST(ProtUtilsNTextTest, BlankMayBeTheSeparator) {
  EXPECT_EQ(Pieces("a b  c", ' '), (Texts{"a", "b", "", "c"}));
}

TEST(ProtUtilsNTextTest, AppendsToWhatIsThere) {
  Texts pieces = {"old"};
  ProtUtilsN::ParseSubstrings("a?b", pieces, '?');
  EXPECT_EQ(pieces, (Texts{"old", "a", "b"}));
}

TEST(ProtUtilsNTextTest, ConfigValueIsTheRunOfLettersAndDigits) {
  std::string value;
  EXPECT_TRUE(ProtUtilsN::GetConfigValue("x=12ab-7", "x", value));
  EXPECT_EQ(value, "12ab");
  EXPECT_TRUE(ProtUtilsN::GetConfigValue("a=1 b=Zz9", "b", value));
  EXPECT_EQ(value, "Zz9");
}

TEST(ProtUtilsNTextTest, ConfigValueMayBeEmpty) {
  std::string value = "former";
  EXPECT_TRUE(ProtUtilsN::GetConfigValue("x= 5", "x", value));
  EXPECT_EQ(value, "");
  value = "former";
  EXPECT_TRUE(ProtUtilsN::GetConfigValue("x=", "x", value));
  EXPECT_EQ(value, "");
}

TEST(ProtUtilsNTextTest, ConfigValueMatchesAnywhere) {
  std::string value;
  EXPECT_TRUE(ProtUtilsN::GetConfigValue("xport=com5 port=com1", "port", value));
  EXPECT_EQ(value, "com5");
}

TEST(ProtUtilsNTextTest, ConfigValueThatIsAbsentChangesNothing) {
  std::string value = "former";
  EXPECT_FALSE(ProtUtilsN::GetConfigValue("x =5 X=6", "x", value));
  EXPECT_FALSE(ProtUtilsN::GetConfigValue("", "x", value));
  EXPECT_EQ(value, "former");
}

TEST(ProtUtilsNTextTest, ConfigValueStopsAtBytesAbove127) {
  std::string value;
  EXPECT_TRUE(ProtUtilsN::GetConfigValue("x=a\xE4", "x", value));
  EXPECT_EQ(value, "a");
}
