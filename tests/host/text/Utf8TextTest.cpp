// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "host/text/Utf8Text.h"

namespace {

TEST(Utf8Text, WellFormedText) {
  for (const char* text : {"", "plain", "\xC2\x80", "\xDF\xBF", "\xE0\xA0\x80", "\xED\x9F\xBF",
                           "\xEE\x80\x80", "\xEF\xBF\xBF", "\xF0\x90\x80\x80", "\xF4\x8F\xBF\xBF",
                           "gr\xC3\xBC\xC3\x9F \xE2\x82\xAC"}) {
    EXPECT_TRUE(IsUtf8(text)) << text;
  }
}

TEST(Utf8Text, MalformedText) {
  const char* const kTexts[] = {
      "\x80",              // continuation without a start
      "\xC3",              // ends early
      "\xE2\x82",          // ends early
      "\xF0\x90\x80",      // ends early
      "\xC3(",             // no continuation
      "\xC0\x80",          // two bytes for one
      "\xC1\xBF",          // two bytes for one
      "\xE0\x9F\xBF",      // three bytes for two
      "\xF0\x8F\xBF\xBF",  // four bytes for three
      "\xED\xA0\x80",      // surrogate
      "\xED\xBF\xBF",      // surrogate
      "\xF4\x90\x80\x80",  // above the last character
      "\xF5\x80\x80\x80",
      "\xFF",
  };
  for (const char* text : kTexts) {
    EXPECT_FALSE(IsUtf8(text)) << testing::PrintToString(text);
    EXPECT_FALSE(IsUtf8(std::string("a") + text)) << testing::PrintToString(text);
  }
}

TEST(Utf8Text, TerminalsGetNoControls) {
  EXPECT_EQ(PrintableUtf8("a\tb\nc \xE2\x82\xAC ~"), "a\tb\nc \xE2\x82\xAC ~");
  EXPECT_EQ(PrintableUtf8("\x1B[31m\r\x7F"), "\\x1B[31m\\x0D\\x7F");
  EXPECT_EQ(PrintableUtf8(std::string(1, '\0')), "\\x00");
  // U+009B starts a control sequence, too.
  EXPECT_EQ(PrintableUtf8("\xC2\x9B"
                          "31m\xC2\xA0"),
            "\\xC2\\x9B31m\xC2\xA0");
  EXPECT_EQ(PrintableUtf8("\xFF\xC3("), "\\xFF\\xC3(");
}

}  // namespace
