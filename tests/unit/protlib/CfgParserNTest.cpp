// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <string>

#include "protlib/CfgParserN.h"

namespace {

std::string Parsed(const std::string& in) {
  std::string out = "former";
  EXPECT_TRUE(CfgParserN::parseValue(in, out));
  return out;
}

int ParsedNumber(const std::string& in) {
  int out = 4711;
  EXPECT_TRUE(CfgParserN::parseValue(in, out));
  return out;
}

}  // namespace

TEST(CfgParserNTest, EntityBecomesASpace) {
  EXPECT_EQ(Parsed("two&nbsp;words"), "two words");
  EXPECT_EQ(Parsed("a&nbsp;&nbsp;b"), "a  b");
  EXPECT_EQ(Parsed("&nbsp;"), " ");
  EXPECT_EQ(Parsed("&nbsp;a&nbsp;"), " a ");
  EXPECT_EQ(Parsed(""), "");
  EXPECT_EQ(Parsed("plain"), "plain");
}

TEST(CfgParserNTest, OnlyTheExactEntityIsReplaced) {
  EXPECT_EQ(Parsed("&NBSP;&nbsp &amp;"), "&NBSP;&nbsp &amp;");
  // What a replacement leaves behind is not looked at again.
  EXPECT_EQ(Parsed("&n&nbsp;bsp;"), "&n bsp;");
}

TEST(CfgParserNTest, InputMayBeTheOutput) {
  std::string text = "a&nbsp;b";
  EXPECT_TRUE(CfgParserN::parseValue(text, text));
  EXPECT_EQ(text, "a b");
}

TEST(CfgParserNTest, ExactWordsAreBooleans) {
  bool value = false;
  EXPECT_TRUE(CfgParserN::parseValue(std::string("true"), value));
  EXPECT_TRUE(value);
  EXPECT_TRUE(CfgParserN::parseValue(std::string("false"), value));
  EXPECT_FALSE(value);
}

TEST(CfgParserNTest, AnythingElseIsNoBooleanAndChangesNothing) {
  for (const std::string word : {"True", "TRUE", "False", "1", "0", "", " true", "true ", "yes"}) {
    for (const bool former : {false, true}) {
      bool value = former;
      EXPECT_FALSE(CfgParserN::parseValue(word, value)) << word;
      EXPECT_EQ(value, former) << word;
    }
  }
}

TEST(CfgParserNTest, NumbersHaveBaseZero) {
  EXPECT_EQ(ParsedNumber("9600"), 9600);
  EXPECT_EQ(ParsedNumber("0x10"), 16);
  EXPECT_EQ(ParsedNumber("0X1f"), 31);
  EXPECT_EQ(ParsedNumber("010"), 8);
  EXPECT_EQ(ParsedNumber("-5"), -5);
}

TEST(CfgParserNTest, NumbersNeverFail) {
  EXPECT_EQ(ParsedNumber("abc"), 0);
  EXPECT_EQ(ParsedNumber(""), 0);
  EXPECT_EQ(ParsedNumber("12ab"), 12);
  EXPECT_EQ(ParsedNumber("089"), 0);
  EXPECT_EQ(ParsedNumber("99999999999999999999"), 2147483647);
  EXPECT_EQ(ParsedNumber("-99999999999999999999"), -2147483647 - 1);
}

TEST(CfgParserNTest, MessagesOfAllResults) {
  const auto message = [](int result) {
    return CfgParserN::getErrorString(static_cast<CfgParser::parseResult>(result), "baudrate");
  };
  EXPECT_EQ(message(2), "Parser: parameter 'baudrate' is not found");
  EXPECT_EQ(message(3), "Parser: parameter 'baudrate' has illegal value");
  EXPECT_EQ(message(4), "Parser: parameter 'baudrate' can't be prefixed");
  EXPECT_EQ(message(5), "Parser: parameter 'baudrate' can't be node independent");
  EXPECT_EQ(message(6), "Parser: parameter 'baudrate' has invalid internal specification");
  for (const int other : {0, 1, 7, -1}) {
    EXPECT_EQ(message(other), "Parser: parameter 'baudrate' has unknown error") << other;
  }
}
