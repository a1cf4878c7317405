// SPDX-License-Identifier: Apache-2.0
// The receive task against the reference framer, on every line of up to seven events.
#include "tests/plugin/PluginFixture.h"
#include "tests/support/HexDump.h"
#include "tests/support/ReferenceFramer.h"

namespace {

#if defined(__SANITIZE_THREAD__) || defined(__SANITIZE_ADDRESS__)
constexpr int kLongest = 5;  // instrumented code is ten times slower
#elif defined(__has_feature)
#if __has_feature(address_sanitizer) || __has_feature(thread_sanitizer)
constexpr int kLongest = 5;
#else
constexpr int kLongest = 7;
#endif
#else
constexpr int kLongest = 7;
#endif

const std::vector<std::string> kFrames = {"",         "\x02",     "\x03",    "\x02\x02",
                                          "\x02\x03", "\x03\x02", "\x03\x03"};

std::string HexText(const std::string& bytes) {
  std::string text;
  for (const char digit : HexDump(bytes)) {
    if (digit != ' ') text += digit;
  }
  return text;
}

std::string Describe(const std::vector<int>& line) {
  std::string text;
  for (const int event : line) {
    text += event == kSilence ? " pause" : " " + HexDump(std::string(1, static_cast<char>(event)));
  }
  return text;
}

class FramingTest : public PluginFixture, public ::testing::WithParamInterface<std::string> {
 protected:
  // A running protocol with the tags that the comparison needs.
  struct Receiver {
    explicit Receiver(PluginUnderTest& plugin) : protocol(plugin) {}
    ProtocolUnderTest protocol;
    const ITag* token = nullptr;
    const ITag* available = nullptr;
    const ITag* acknowledge = nullptr;
  };

  static void Start(Receiver& receiver, const std::string& prefix, const std::string& suffix) {
    ASSERT_TRUE(receiver.protocol.Config(
        Mandatory("gap=1 rx_prefix=" + HexText(prefix) + " rx_suffix=" + HexText(suffix))));
    ASSERT_NE(receiver.protocol->Start(), 0);
    receiver.token = receiver.protocol.Tag("0?rx_token?string-20");
    receiver.available = receiver.protocol.Tag("0?tokens_available?unsignedInt");
    receiver.acknowledge = receiver.protocol.Tag("0?token_ack?boolean");
  }

  static std::vector<std::string> Take(Receiver& receiver) {
    std::vector<std::string> tokens;
    const unsigned char on = 1;
    for (;;) {
      unsigned char count[4] = {};
      EXPECT_NE(receiver.protocol->Read(receiver.available, count), 0);
      if (count[0] == 0) return tokens;
      char text[20] = {};
      EXPECT_NE(receiver.protocol->Read(receiver.token, reinterpret_cast<unsigned char*>(text)), 0);
      tokens.emplace_back(text);
      EXPECT_NE(receiver.protocol->Write(receiver.acknowledge, &on), 0);
    }
  }

  std::vector<std::string> Receive(Receiver& receiver, const std::vector<int>& line) {
    for (const int event : line) {
      if (event == kSilence) {
        host_.Line().Silence(1);
      } else {
        host_.Line().Feed(std::string(1, static_cast<char>(event)));
      }
    }
    host_.Line().Feed("");  // also an empty line is received once more until it is silent
    host_.RunUntilSilent();
    return Take(receiver);
  }
};

TEST_P(FramingTest, AgreesWithTheReferenceOnEveryShortLine) {
  host_.Log().SetRecording(false);
  const std::string& prefix = GetParam();
  const std::vector<int> symbols = {0x02, 0x03, 0x41, kSilence};
  for (const std::string& suffix : kFrames) {
    Receiver receiver(plugin_);
    ASSERT_NO_FATAL_FAILURE(Start(receiver, prefix, suffix));
    int mismatches = 0;
    long long compared = 0;
    std::vector<std::size_t> digits;  // the line as a number in the base of the symbols
    for (std::size_t length = 0; length <= kLongest; ++length) {
      digits.assign(length, 0);
      for (bool more = true; more;) {
        std::vector<int> line;
        for (const std::size_t digit : digits) line.push_back(symbols[digit]);
        std::vector<int> withEnd = line;
        withEnd.push_back(kSilence);
        const auto expected = ReferenceTokens(withEnd, prefix, suffix);
        const auto actual = Receive(receiver, line);
        ++compared;
        if (actual != expected && ++mismatches <= 5) {
          ADD_FAILURE() << "prefix " << HexDump(prefix) << ", suffix " << HexDump(suffix)
                        << ", line" << Describe(line) << ": " << ::testing::PrintToString(actual)
                        << " instead of " << ::testing::PrintToString(expected);
        }
        more = false;
        for (std::size_t& digit : digits) {
          if (++digit < symbols.size()) {
            more = true;
            break;
          }
          digit = 0;
        }
      }
    }
    EXPECT_EQ(mismatches, 0);
    EXPECT_GE(compared, 1365);
    receiver.protocol->Stop();
  }
}

INSTANTIATE_TEST_SUITE_P(Prefixes, FramingTest, ::testing::ValuesIn(kFrames),
                         [](const auto& frame) {
                           return frame.param.empty() ? "none" : "x" + HexText(frame.param);
                         });

// The oracle itself, on the cases that can be checked by eye.
TEST(ReferenceFramerTest, NamedCases) {
  using Tokens = std::vector<std::string>;
  const int pause = kSilence;
  EXPECT_EQ(ReferenceTokens({2, 'A', 'B', 3}, "\x02", "\x03"), Tokens({"AB"}));
  EXPECT_EQ(ReferenceTokens({2, 5, 2, 2, 'A', 3}, "\x02\x02", "\x03"), Tokens({"A"}));
  EXPECT_EQ(ReferenceTokens({2, 'A', 2, 'B', pause}, "\x02", ""), Tokens({"A", "B"}));
  EXPECT_EQ(ReferenceTokens({2, 2}, "\x02", ""), Tokens({""}));
  EXPECT_EQ(ReferenceTokens({2, 2, 2}, "\x02\x02", ""), Tokens({""}));
  EXPECT_EQ(ReferenceTokens({'A', pause, 'B', 'C', pause}, "", ""), Tokens({"A", "BC"}));
  EXPECT_EQ(ReferenceTokens({'A', pause, 'B', 3}, "", "\x03"), Tokens({"B"}));
  EXPECT_EQ(ReferenceTokens({'A', pause}, "", "\x03"), Tokens());
  EXPECT_EQ(ReferenceTokens(std::vector<int>(1001, 'a'), "", ""), Tokens());
}

}  // namespace
