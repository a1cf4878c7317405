// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "host/term/TermModes.h"

namespace {

TEST(TermModes, EachNameIsReadAsItIsWritten) {
  for (const char* const name : kInputModeNames) {
    InputMode mode{};
    ASSERT_TRUE(ParseMode(name, &mode)) << name;
    EXPECT_STREQ(NameOf(mode), name);
  }
  for (const char* const name : kOutputModeNames) {
    OutputMode mode{};
    ASSERT_TRUE(ParseMode(name, &mode)) << name;
    EXPECT_STREQ(NameOf(mode), name);
  }
}

TEST(TermModes, OtherNamesAreRefusedAndChangeNothing) {
  InputMode input = InputMode::kHex;
  OutputMode output = OutputMode::kDump;
  for (const char* const name : {"", "Text", "raw ", "json"}) {
    EXPECT_FALSE(ParseMode(name, &input)) << name;
    EXPECT_FALSE(ParseMode(name, &output)) << name;
  }
  EXPECT_FALSE(ParseMode("raw", &input));
  EXPECT_FALSE(ParseMode("console", &output));
  EXPECT_EQ(input, InputMode::kHex);
  EXPECT_EQ(output, OutputMode::kDump);
}

TEST(TermModes, GoRoundInTheOrderOfTheNames) {
  EXPECT_EQ(NextOf(InputMode::kText), InputMode::kHex);
  EXPECT_EQ(NextOf(InputMode::kHex), InputMode::kConsole);
  EXPECT_EQ(NextOf(InputMode::kConsole), InputMode::kText);
  EXPECT_EQ(NextOf(OutputMode::kText), OutputMode::kHex);
  EXPECT_EQ(NextOf(OutputMode::kHex), OutputMode::kDump);
  EXPECT_EQ(NextOf(OutputMode::kDump), OutputMode::kRaw);
  EXPECT_EQ(NextOf(OutputMode::kRaw), OutputMode::kText);
}

}  // namespace
