// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "host/sim/SimWords.h"

namespace {

TEST(SimWords, Times) {
  int timeMs = -1;
  EXPECT_TRUE(ParseTimeMs("250", 1, &timeMs));
  EXPECT_EQ(timeMs, 250);
  EXPECT_TRUE(ParseTimeMs("250ms", 1000, &timeMs));
  EXPECT_EQ(timeMs, 250);
  EXPECT_TRUE(ParseTimeMs("2s", 1, &timeMs));
  EXPECT_EQ(timeMs, 2000);
  EXPECT_TRUE(ParseTimeMs("1.5", 1000, &timeMs));
  EXPECT_EQ(timeMs, 1500);
  EXPECT_TRUE(ParseTimeMs("0", 1, &timeMs));
  EXPECT_EQ(timeMs, 0);
  timeMs = 77;
  for (const char* word :
       {"", "s", "ms", "-1", "1m", "1 s", "1e3", ".5", "1.", "1.2.3", "90000s"}) {
    EXPECT_FALSE(ParseTimeMs(word, 1, &timeMs)) << word;
  }
  EXPECT_EQ(timeMs, 77);
}

TEST(SimWords, Percents) {
  double percent = -1;
  EXPECT_TRUE(ParsePercent("5", &percent));
  EXPECT_EQ(percent, 5);
  EXPECT_TRUE(ParsePercent("0.5%", &percent));
  EXPECT_EQ(percent, 0.5);
  EXPECT_TRUE(ParsePercent("100%", &percent));
  EXPECT_EQ(percent, 100);
  for (const char* word : {"", "%", "101", "-1", "5%%", "a", "nan", "inf"}) {
    EXPECT_FALSE(ParsePercent(word, &percent)) << word;
  }
  EXPECT_EQ(percent, 100);
}

TEST(SimWords, Splits) {
  FaultOptions options;
  EXPECT_TRUE(ParseSplit("3", &options));
  EXPECT_EQ(options.pieces, 3U);
  EXPECT_EQ(options.pauseMs, 20);
  EXPECT_TRUE(ParseSplit("50ms", &options));
  EXPECT_EQ(options.pieces, 2U);
  EXPECT_EQ(options.pauseMs, 50);
  EXPECT_TRUE(ParseSplit("4@1s", &options));
  EXPECT_EQ(options.pieces, 4U);
  EXPECT_EQ(options.pauseMs, 1000);
  EXPECT_TRUE(ParseSplit("4@5", &options));
  EXPECT_EQ(options.pauseMs, 5);
  for (const char* word : {"", "0", "1.5", "3@", "@5", "50ms@3", "x", "1001"}) {
    EXPECT_FALSE(ParseSplit(word, &options)) << word;
  }
  EXPECT_EQ(options.pieces, 4U);
}

TEST(SimWords, BodiesThatAreTooLong) {
  FaultOptions options;
  EXPECT_TRUE(ParseTooLong("1200", &options));
  EXPECT_EQ(options.tooLongBytes, 1200U);
  EXPECT_EQ(options.tooLongPercent, 100);
  EXPECT_TRUE(ParseTooLong("1500@5%", &options));
  EXPECT_EQ(options.tooLongBytes, 1500U);
  EXPECT_EQ(options.tooLongPercent, 5);
  for (const char* word : {"", "0", "5%", "1200@", "@5", "1200@200", "9999999"}) {
    EXPECT_FALSE(ParseTooLong(word, &options)) << word;
  }
  EXPECT_EQ(options.tooLongBytes, 1500U);
}

TEST(SimWords, EscapedTexts) {
  std::string text;
  EXPECT_TRUE(ParseEscapedText(R"(a\x1Db\r\n\t\0\\)", &text));
  EXPECT_EQ(text, std::string("a\x1D"
                              "b\r\n\t\0\\",
                              8));
  for (const char* word : {"\\", "\\q", "\\x1", "\\x", "\\xG0", "\\x 1"}) {
    EXPECT_FALSE(ParseEscapedText(word, &text)) << word;
  }
  EXPECT_TRUE(ParseEscapedText("", &text));
  EXPECT_EQ(text, "");
}

}  // namespace
