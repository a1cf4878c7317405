// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "host/term/TypedText.h"
#include "host/text/ByteText.h"

namespace {

std::string Parse(const std::string& text) {
  std::string bytes = "(untouched)";
  std::string error;
  return ParseTypedText(text, &bytes, &error) ? bytes : "refused: " + bytes;
}

TEST(TypedText, ReadsWhatEscapeBytesWrites) {
  std::string all;
  for (int byte = 0; byte < 256; ++byte) {
    all += static_cast<char>(static_cast<unsigned char>(byte));
  }
  EXPECT_EQ(Parse(EscapeBytes(all)), all);
}

TEST(TypedText, KnowsTheEscapesOfC) {
  EXPECT_EQ(Parse("R"), "R");
  EXPECT_EQ(Parse(""), "");
  EXPECT_EQ(Parse(R"(\a\b\e\f\n\r\t\v\\\"\'\?)"), "\a\b\x1B\f\n\r\t\v\\\"'?");
  EXPECT_EQ(Parse(R"(\x02A\x41B\xfF)"),
            "\x02"
            "AAB\xFF");
  EXPECT_EQ(Parse(R"(\x024)"),
            "\x02"
            "4");
  EXPECT_EQ(Parse(R"(\0\12\1018\3771)"), std::string("\0\nA8\xFF"
                                                     "1",
                                                     6));
  EXPECT_EQ(Parse("\xC3\xA4"), "\xC3\xA4");
}

TEST(TypedText, RefusesAnyOtherBackslash) {
  for (const char* const text : {"\\", "A\\", "\\q", "\\x", "\\x2", "\\x2g", "\\x 2", "\\8",
                                 "\\400", "\\777", "good\\nbad\\z"}) {
    EXPECT_EQ(Parse(text), "refused: (untouched)") << text;
  }
}

}  // namespace
