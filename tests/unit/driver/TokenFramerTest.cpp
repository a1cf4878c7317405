// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "driver/TokenFramer.h"
#include "tests/unit/FailingNew.h"

namespace {

using Texts = std::vector<std::string>;

constexpr int kPause = -1;

// What a line does: bytes, and pauses that are longer than the gap.
using Line = std::vector<int>;

Line LineOf(const std::string& bytes) {
  Line line;
  for (const char c : bytes) line.push_back(static_cast<unsigned char>(c));
  return line;
}

Line operator+(Line line, const std::string& bytes) {
  for (const int event : LineOf(bytes)) line.push_back(event);
  return line;
}

Line Pause(Line line) {
  line.push_back(kPause);
  return line;
}

// The tokens that pass after pass of the framer cuts from the line.
Texts Cut(const Line& line, const RxFraming& framing) {
  Texts tokens;
  TokenFramer framer;
  bool inPass = false;
  for (const int event : line) {
    if (!inPass) framer.Begin(framing);
    inPass = true;
    if (event == kPause) {
      if (framer.OnSilence()) tokens.emplace_back(framer.Token());
      inPass = false;
      continue;
    }
    switch (framer.OnByte(static_cast<unsigned char>(event))) {
      case TokenFramer::Result::kMore:
        break;
      case TokenFramer::Result::kTokenAndMore:
        tokens.emplace_back(framer.Token());
        break;
      case TokenFramer::Result::kToken:
        tokens.emplace_back(framer.Token());
        inPass = false;
        break;
      case TokenFramer::Result::kDropped:
        inPass = false;
        break;
    }
  }
  return tokens;
}

Texts Cut(const std::string& bytes, const RxFraming& framing) {
  return Cut(LineOf(bytes), framing);
}

bool EndsWith(const std::string& text, const std::string& mark) {
  return text.size() >= mark.size() && text.substr(text.size() - mark.size()) == mark;
}

// The text without so many bytes in front and behind; empty where the two overlap.
std::string Between(const std::string& text, std::size_t front, std::size_t behind) {
  if (text.size() < front + behind) return "";
  return text.substr(front, text.size() - front - behind);
}

// The rules of framing once more, one pass after the other over the whole line, slow and plain.
Texts ReferenceCut(const Line& line, const std::string& prefix, const std::string& suffix) {
  Texts tokens;
  std::size_t at = 0;
  while (at < line.size()) {
    // One pass: first the prefix ...
    std::string buffer;
    bool over = false;
    while (!over && buffer != prefix) {
      if (at == line.size()) return tokens;
      const int event = line[at++];
      if (event == kPause) {
        over = true;
      } else if (prefix[buffer.size()] == static_cast<char>(event)) {
        buffer += static_cast<char>(event);
      } else {
        buffer = prefix[0] == static_cast<char>(event) ? prefix.substr(0, 1) : "";
      }
    }
    // ... then the body.
    std::size_t count = prefix.size();
    while (!over) {
      if (at == line.size()) return tokens;
      const int event = line[at++];
      if (event == kPause) {
        if (suffix.empty() && buffer.size() > prefix.size()) {
          tokens.push_back(buffer.substr(prefix.size()));
        }
        break;
      }
      buffer += static_cast<char>(event);
      ++count;
      if (count >= prefix.size() + suffix.size()) {
        if (!suffix.empty() && EndsWith(buffer, suffix)) {
          tokens.push_back(Between(buffer, prefix.size(), suffix.size()));
          break;
        }
        if (suffix.empty() && !prefix.empty() && EndsWith(buffer, prefix)) {
          tokens.push_back(Between(buffer, prefix.size(), prefix.size()));
          buffer = prefix;
        }
      }
      if (buffer.size() > 1000) break;
    }
  }
  return tokens;
}

// All texts over three bytes up to that length, the empty one included.
Texts AllTexts(std::size_t longest) {
  Texts texts = {""};
  for (std::size_t i = 0; i < texts.size(); ++i) {
    if (texts[i].size() == longest) continue;
    for (const char c : {'\x01', '\x02', '\xFE'}) {
      const std::string longer = texts[i] + c;
      texts.push_back(longer);
    }
  }
  return texts;
}

std::string Show(const Line& line) {
  std::string text;
  for (const int event : line) text += event == kPause ? "pause " : std::to_string(event) + " ";
  return text;
}

// What a framer says to `count` times the same byte behind the framer's beginning.
std::vector<TokenFramer::Result> Results(const RxFraming& framing, const std::string& bytes) {
  TokenFramer framer;
  framer.Begin(framing);
  std::vector<TokenFramer::Result> results;
  for (const char c : bytes) results.push_back(framer.OnByte(static_cast<unsigned char>(c)));
  return results;
}

const RxFraming kBoth = {"\x02", "\x03"};
const RxFraming kPrefixOnly = {"\x02", ""};
const RxFraming kSuffixOnly = {"", "\x0D\x0A"};
const RxFraming kNeither = {};

}  // namespace

// --- prefix and suffix ---

TEST(TokenFramerTest, TokenStandsBetweenPrefixAndSuffix) {
  EXPECT_EQ(Cut("\x02"
                "AB\x03",
                kBoth),
            Texts{"AB"});
  EXPECT_EQ(Cut("xx\x02"
                "A\x03yy\x02"
                "B\x03",
                kBoth),
            (Texts{"A", "B"}));
}

TEST(TokenFramerTest, TokenMayBeEmpty) { EXPECT_EQ(Cut("\x02\x03", kBoth), Texts{""}); }

TEST(TokenFramerTest, TokenMayHoldThePrefix) {
  EXPECT_EQ(Cut("\x02\x02\x02"
                "A\x03",
                kBoth),
            Texts{"\x02\x02"
                  "A"});
}

TEST(TokenFramerTest, TokenMayHoldAnyBytes) {
  for (int value = 0; value < 256; ++value) {
    if (value == 3) continue;
    const std::string byte(1, static_cast<char>(static_cast<unsigned char>(value)));
    EXPECT_EQ(Cut("\x02" + byte + "\x03", kBoth), Texts{byte}) << value;
  }
}

TEST(TokenFramerTest, SilenceDropsATokenWithoutItsSuffix) {
  EXPECT_EQ(Cut(Pause(LineOf("\x02"
                             "AB")) +
                    "\x03\x02"
                    "C\x03",
                kBoth),
            Texts{"C"});
}

TEST(TokenFramerTest, MismatchRestartsThePrefixAtTheMismatchingByte) {
  const RxFraming framing = {"\x02\x02", "\x03"};
  EXPECT_EQ(Cut("\x02\x05\x02\x02"
                "A\x03",
                framing),
            Texts{"A"});
  // Without further back-tracking: the second 01 of 01 01 02 is not tried as the prefix's first.
  const RxFraming threeBytes = {"\x01\x01\x02", "\x03"};
  EXPECT_EQ(Cut("\x01\x01\x01\x02"
                "A\x03",
                threeBytes),
            Texts{});
  EXPECT_EQ(Cut("\x01\x01\x05\x01\x01\x02"
                "A\x03",
                threeBytes),
            Texts{"A"});
}

TEST(TokenFramerTest, SilenceDropsAPartOfThePrefix) {
  const RxFraming framing = {"\x02\x02", "\x03"};
  EXPECT_EQ(Cut(Pause(LineOf("\x02")) + "\x02"
                                        "A\x03",
                framing),
            Texts{});
  EXPECT_EQ(Cut(Pause(LineOf("\x02")) + "\x02\x02"
                                        "A\x03",
                framing),
            Texts{"A"});
}

TEST(TokenFramerTest, SuffixMayBeSplitAndRepeated) {
  EXPECT_EQ(Cut("A\x0D"
                "B\x0D\x0A",
                kSuffixOnly),
            Texts{"A\x0D"
                  "B"});
  EXPECT_EQ(Cut("A\x0D\x0D\x0A", kSuffixOnly), Texts{"A\x0D"});
  EXPECT_EQ(Cut("A\x0D\x0A\x0D\x0A", kSuffixOnly), (Texts{"A", ""}));
}

TEST(TokenFramerTest, PrefixAndSuffixDoNotShareBytes) {
  const RxFraming framing = {"\x01\x02", "\x02\x03"};
  EXPECT_EQ(Cut("\x01\x02\x03\x02\x03", framing), Texts{"\x03"});
  const RxFraming equal = {"\x02", "\x02"};
  EXPECT_EQ(Cut("\x02\x02\x02"
                "A\x02",
                equal),
            (Texts{"", "A"}));
}

// --- prefix only ---

TEST(TokenFramerTest, NextPrefixOrSilenceEndsAToken) {
  EXPECT_EQ(Cut(Pause(LineOf("\x02"
                             "A\x02"
                             "B")),
                kPrefixOnly),
            (Texts{"A", "B"}));
}

TEST(TokenFramerTest, TwoPrefixesHoldAnEmptyToken) {
  EXPECT_EQ(Cut("\x02\x02", kPrefixOnly), Texts{""});
  EXPECT_EQ(Cut(Pause(LineOf("\x02\x02")), kPrefixOnly), Texts{""});
}

TEST(TokenFramerTest, SilenceBehindABarePrefixMakesNoToken) {
  EXPECT_EQ(Cut(Pause(LineOf("\x02")), kPrefixOnly), Texts{});
  EXPECT_EQ(Cut(Pause(LineOf("\x02"
                             "A\x02")),
                kPrefixOnly),
            Texts{"A"});
}

TEST(TokenFramerTest, OverlappingPrefixesHoldAnEmptyToken) {
  const RxFraming framing = {"\x02\x02", ""};
  EXPECT_EQ(Cut("\x02\x02\x02", framing), Texts{""});
  EXPECT_EQ(Cut("\x02\x02\x02\x02", framing), (Texts{"", ""}));
  EXPECT_EQ(Cut(Pause(LineOf("\x02\x02\x02"
                             "A")),
                framing),
            (Texts{"", "A"}));
}

TEST(TokenFramerTest, PartOfTheNextPrefixBelongsToTheToken) {
  const RxFraming framing = {"\x01\x02", ""};
  EXPECT_EQ(Cut(Pause(LineOf("\x01\x02"
                             "A\x01")),
                framing),
            Texts{"A\x01"});
}

// --- suffix only, and neither ---

TEST(TokenFramerTest, SuffixAloneEndsEachToken) {
  EXPECT_EQ(Cut("A\x0D\x0A"
                "BC\x0D\x0A",
                kSuffixOnly),
            (Texts{"A", "BC"}));
  EXPECT_EQ(Cut(Pause(LineOf("A\x0D")) + "\x0A", kSuffixOnly), Texts{});
}

TEST(TokenFramerTest, WithoutFramingOnlySilenceEndsAToken) {
  EXPECT_EQ(Cut(Pause(Pause(LineOf("ABC")) + "D"), kNeither), (Texts{"ABC", "D"}));
  EXPECT_EQ(Cut("ABC", kNeither), Texts{});
  EXPECT_EQ(Cut(Pause(Pause({})), kNeither), Texts{});
}

// --- the limit of 1000 bytes ---

TEST(TokenFramerTest, WithoutFramingATokenHasAtMost1000Bytes) {
  const std::string longest(1000, 'A');
  EXPECT_EQ(Cut(Pause(LineOf(longest)), kNeither), Texts{longest});
  EXPECT_EQ(Cut(Pause(LineOf(longest + "A")), kNeither), Texts{});
  // The next pass starts afresh.
  EXPECT_EQ(Cut(Pause(LineOf(longest + "AB")), kNeither), Texts{"B"});
}

TEST(TokenFramerTest, ByteThatIsTooManyEndsThePass) {
  const auto results = Results(kNeither, std::string(1001, 'A'));
  for (std::size_t i = 0; i < 1000; ++i) ASSERT_EQ(results[i], TokenFramer::Result::kMore) << i;
  EXPECT_EQ(results[1000], TokenFramer::Result::kDropped);
}

TEST(TokenFramerTest, ThousandAndOneBytesWithoutSuffixAreDropped) {
  const RxFraming framing = {"", "\x03"};
  const std::string body(1000, 'A');
  EXPECT_EQ(Cut(body + "A\x03", framing), Texts{""});   // the suffix alone is left
  EXPECT_EQ(Cut(body + "\x03", framing), Texts{body});  // the suffix comes first
  EXPECT_EQ(Cut(std::string(999, 'A') + "\x03", framing), Texts{std::string(999, 'A')});
}

TEST(TokenFramerTest, FramingCountsTowardTheLimit) {
  const std::string fits(999, 'A');
  EXPECT_EQ(Cut("\x02" + fits + "\x03", kBoth), Texts{fits});
  EXPECT_EQ(Cut("\x02" + fits + "A\x03", kBoth), Texts{});
  EXPECT_EQ(Cut(Pause(LineOf("\x02" + fits)), kPrefixOnly), Texts{fits});
  EXPECT_EQ(Cut(Pause(LineOf("\x02" + fits + "A")), kPrefixOnly), Texts{});
  EXPECT_EQ(Cut("\x02" + fits + "\x02", kPrefixOnly), Texts{fits});
}

TEST(TokenFramerTest, LimitCountsFromTheLastPrefix) {
  const std::string body(600, 'A');
  EXPECT_EQ(Cut(Pause(LineOf("\x02" + body + "\x02" + body + "\x02" + body)), kPrefixOnly),
            (Texts{body, body, body}));
}

TEST(TokenFramerTest, SuffixThatWouldPassTheLimitHalfwayDropsTheToken) {
  const RxFraming framing = {"", "\x0D\x0A"};
  EXPECT_EQ(Cut(std::string(999, 'A') + "\x0D\x0A", framing), Texts{std::string(999, 'A')});
  EXPECT_EQ(Cut(std::string(1000, 'A') + "\x0D\x0A", framing), Texts{});
}

TEST(TokenFramerTest, PrefixOf1000BytesLeavesNoRoomForAToken) {
  const RxFraming framing = {std::string(999, '\x01') + "\x02", ""};
  EXPECT_EQ(Cut(Pause(LineOf(framing.prefix + "A")), framing), Texts{});
  EXPECT_EQ(Results(framing, framing.prefix + "A").back(), TokenFramer::Result::kDropped);
}

TEST(TokenFramerTest, PrefixOfMoreThan1000BytesCanMatch) {
  const RxFraming framing = {std::string(1500, '\x01'), ""};
  const auto results = Results(framing, framing.prefix + "\x01");
  for (std::size_t i = 0; i < 1500; ++i) ASSERT_EQ(results[i], TokenFramer::Result::kMore) << i;
  // The overlapping next prefix makes an empty token; it alone is too much to go on with.
  EXPECT_EQ(results.back(), TokenFramer::Result::kToken);
  EXPECT_EQ(Results(framing, framing.prefix + "A").back(), TokenFramer::Result::kDropped);
}

TEST(TokenFramerTest, PrefixAndSuffixOfMoreThan1000BytesHoldOneByteAtMost) {
  const RxFraming framing = {std::string(1200, '\x01'), "\x03"};
  EXPECT_EQ(Cut(framing.prefix + "\x03", framing), Texts{""});
  EXPECT_EQ(Cut(framing.prefix + "A\x03", framing), Texts{});
}

// --- the object ---

TEST(TokenFramerTest, SilenceAtOnceMakesNothing) {
  for (const RxFraming& framing : {kBoth, kPrefixOnly, kSuffixOnly, kNeither}) {
    TokenFramer framer;
    framer.Begin(framing);
    EXPECT_FALSE(framer.OnSilence());
  }
}

TEST(TokenFramerTest, BeginForgetsWhatWasGathered) {
  TokenFramer framer;
  framer.Begin(kPrefixOnly);
  framer.OnByte(2);
  framer.OnByte('A');
  framer.Begin(kNeither);
  framer.OnByte('B');
  EXPECT_TRUE(framer.OnSilence());
  EXPECT_EQ(framer.Token(), "B");
  framer.Begin(kPrefixOnly);
  framer.OnByte(2);
  framer.OnByte(2);
  framer.Begin(kPrefixOnly);
  EXPECT_EQ(framer.Token(), "");
  EXPECT_FALSE(framer.OnSilence());
}

TEST(TokenFramerTest, MemoryOfOnePassServesTheNext) {
  TokenFramer framer;
  const auto pass = [&framer] {
    framer.Begin(kBoth);
    framer.OnByte(2);
    for (int i = 0; i < 900; ++i) framer.OnByte('A');
    framer.OnByte(3);
  };
  pass();
  const long long before = FailingNew::Count();
  pass();
  EXPECT_EQ(FailingNew::Count(), before);
}

// --- against the reference ---

TEST(TokenFramerTest, AgreesWithTheReferenceOnAllShortLines) {
  const Texts lines = AllTexts(7);
  const Texts marks = AllTexts(2);
  for (const std::string& prefix : marks) {
    for (const std::string& suffix : marks) {
      const RxFraming framing = {prefix, suffix};
      for (const std::string& bytes : lines) {
        const Line line = Pause(LineOf(bytes));
        ASSERT_EQ(Cut(line, framing), ReferenceCut(line, prefix, suffix))
            << "prefix " << Show(LineOf(prefix)) << " suffix " << Show(LineOf(suffix)) << " line "
            << Show(line);
      }
    }
  }
}

TEST(TokenFramerTest, AgreesWithTheReferenceOnShortLinesWithAPause) {
  const Texts lines = AllTexts(5);
  const Texts marks = AllTexts(2);
  for (const std::string& prefix : marks) {
    for (const std::string& suffix : marks) {
      const RxFraming framing = {prefix, suffix};
      for (const std::string& bytes : lines) {
        for (std::size_t pauseAt = 1; pauseAt < bytes.size(); ++pauseAt) {
          const Line line = Pause(Pause(LineOf(bytes.substr(0, pauseAt))) + bytes.substr(pauseAt));
          ASSERT_EQ(Cut(line, framing), ReferenceCut(line, prefix, suffix)) << Show(line);
        }
      }
    }
  }
}

TEST(TokenFramerTest, AgreesWithTheReferenceAroundTheLimit) {
  for (const std::string& prefix : Texts{"", "\x02", "\x02\x01", std::string(999, '\x02'),
                                         std::string(1000, '\x02'), std::string(1001, '\x02')}) {
    for (const std::string& suffix : Texts{"", "\x03", "\x03\x01", std::string(999, '\x03'),
                                           std::string(1000, '\x03'), std::string(1001, '\x03')}) {
      for (const std::size_t length :
           std::vector<std::size_t>{0, 1, 2, 997, 998, 999, 1000, 1001, 1002, 1003, 2002}) {
        for (const char body : {'A', '\x02', '\x03'}) {
          const std::string one = prefix + std::string(length, body) + suffix;
          const Line line = Pause(LineOf(one + one));
          ASSERT_EQ(Cut(line, {prefix, suffix}), ReferenceCut(line, prefix, suffix))
              << "prefix " << prefix.size() << " suffix " << suffix.size() << " body " << length
              << " of " << static_cast<int>(body);
        }
      }
    }
  }
}
