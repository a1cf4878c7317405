// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "host/document/Inflate.h"
#include "tests/host/document/FakeLibrary.h"

namespace {

constexpr int kMaxBytes = 100000;

std::string InflateErrorOf(const std::string& stream) {
  std::string text = "untouched";
  std::string error;
  EXPECT_FALSE(Inflate(stream, kMaxBytes, &text, &error));
  EXPECT_EQ(text, "untouched");
  return error;
}

TEST(Inflate, GivesTheText) {
  for (const std::string& expected :
       {std::string(), std::string("a"), std::string(70000, 'x') + "y"}) {
    std::string text;
    std::string error;
    ASSERT_TRUE(Inflate(Compress(expected), kMaxBytes, &text, &error)) << error;
    EXPECT_EQ(text, expected);
  }
}

TEST(Inflate, TakesExactlyTheLimit) {
  std::string text;
  std::string error;
  EXPECT_TRUE(Inflate(Compress(std::string(kMaxBytes, 'x')), kMaxBytes, &text, &error));
  EXPECT_EQ(InflateErrorOf(Compress(std::string(kMaxBytes + 1, 'x'))),
            "the document inflates to more than 100000 bytes");
}

TEST(Inflate, StopsAtTheLimitOfALongStream) {
  // 20 MB of zeros in 20 KB.
  const std::string bomb = Compress(std::string(20UL * 1000 * 1000, '\0'));
  EXPECT_EQ(InflateErrorOf(bomb), "the document inflates to more than 100000 bytes");
}

TEST(Inflate, RefusesEveryTruncation) {
  const std::string stream = Compress("a text that is long enough to have some parts");
  for (std::size_t length = 0; length < stream.size(); ++length) {
    EXPECT_EQ(InflateErrorOf(stream.substr(0, length)), "the compressed document ends early")
        << length;
  }
}

TEST(Inflate, RefusesWhatFollows) {
  EXPECT_EQ(InflateErrorOf(Compress("text") + "abc"),
            "the compressed document ends 3 bytes before its stated length");
}

TEST(Inflate, RefusesDamage) {
  std::string stream = Compress("text");
  stream.back() = static_cast<char>(stream.back() ^ 1);
  EXPECT_EQ(InflateErrorOf(stream), "the compressed document is no whole zlib stream");
  EXPECT_EQ(InflateErrorOf("plain text"), "the compressed document is no whole zlib stream");
  // A stream that needs a dictionary.
  EXPECT_EQ(InflateErrorOf(std::string("\x78\xBB\x01\x02\x03\x04"
                                       "abcdef",
                                       12)),
            "the compressed document is no whole zlib stream");
}

}  // namespace
