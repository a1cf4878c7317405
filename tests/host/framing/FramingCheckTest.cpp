// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <random>

#include "host/framing/FramingCheck.h"

namespace {

// Findings and lost tokens, one a line.
class CheckLog final : public CheckSink {
 public:
  void OnLabelled(const LabelledBytes& /*labelled*/) override {}
  void OnCutToken(const CutToken& token) override { tokens_.push_back(token.bytes); }
  void OnFinding(const FramingFinding& finding) override { text_ += finding.text + "\n"; }
  void OnQueueFull(const CutToken& token) override { text_ += "full " + token.bytes + "\n"; }

  const std::string& Text() const { return text_; }
  std::vector<std::string> tokens_;

 private:
  std::string text_;
};

class FramingCheckTest : public ::testing::Test {
 protected:
  static FramingSettings Settings(int queueTokens = 100, const std::string& suffix = "\r") {
    FramingSettings settings;
    settings.rxSuffix = suffix;
    settings.queueTokens = queueTokens;
    return settings;
  }

  void Line(const std::string& bytes) { check_.OnBytes(bytes); }
  void Silence() { check_.OnSilence(500); }
  void Take(const std::string& bytes) { check_.OnDriverToken({bytes, bytes.size(), false}); }
  // The reader saw an empty queue twice.
  void Empty() {
    check_.OnEmptyQueue();
    check_.OnEmptyQueue();
  }
  void ExpectComparing(std::uint64_t tokens) {
    EXPECT_TRUE(check_.IsComparing());
    EXPECT_EQ(check_.ComparedTokens(), tokens);
  }

  CheckLog log_;
  FramingCheck check_{Settings(), &log_};
};

TEST_F(FramingCheckTest, SameTokensGiveNoFinding) {
  Line("a\rb\r");
  Take("a");
  Take("b");
  Line("c\r");
  Take("c");
  Silence();
  Empty();
  ExpectComparing(3);
  EXPECT_EQ(log_.Text(), "");
}

TEST_F(FramingCheckTest, TheReaderMayBeAheadOfTheLine) {
  Take("a");
  Take("b");
  Empty();
  Line("a\rb\r");
  Silence();
  Empty();
  ExpectComparing(2);
  EXPECT_EQ(log_.Text(), "");
}

TEST_F(FramingCheckTest, ADifferenceIsToldOnceAndTheRestCompared) {
  Line("a\rb\rc\rd\r");
  Take("a");
  Take("x");
  EXPECT_EQ(log_.Text(), "");  // more bytes may be on their way
  Take("c");
  Silence();
  EXPECT_EQ(log_.Text(), "the driver has \"x\" where \"b\" is expected\n");
  Take("d");
  Silence();
  ExpectComparing(3);
  EXPECT_EQ(check_.Findings(), 1U);
}

TEST_F(FramingCheckTest, ATokenThatTheDriverDidNotQueue) {
  Line("a\rb\rc\r");
  Take("a");
  Take("c");
  Silence();
  EXPECT_EQ(log_.Text(), "the driver did not queue \"b\"\n");
  ExpectComparing(2);
}

TEST_F(FramingCheckTest, ATokenThatTheDriverDidNotQueueAtTheEnd) {
  Line("a\rb\rc\r");
  Take("a");
  check_.OnEmptyQueue();  // the driver may not have queued them yet
  check_.OnEmptyQueue();
  EXPECT_EQ(log_.Text(), "");
  Silence();
  check_.OnEmptyQueue();  // asked before the silence, perhaps
  EXPECT_EQ(log_.Text(), "");
  check_.OnEmptyQueue();
  EXPECT_EQ(log_.Text(), "the driver did not queue \"b\" and 1 more behind it\n");
  Empty();
  EXPECT_EQ(check_.Findings(), 1U);
}

TEST_F(FramingCheckTest, ATokenThatNoFrameGives) {
  Line("a\rb\r");
  Take("a");
  Take("x");
  Take("b");
  Silence();
  EXPECT_EQ(log_.Text(), "the driver has a token \"x\" that no frame gives\n");
  ExpectComparing(2);
  Take("y");
  Silence();
  EXPECT_EQ(check_.Findings(), 2U);
}

TEST_F(FramingCheckTest, FindingsCarryBothSides) {
  class Keeper final : public CheckSink {
   public:
    void OnLabelled(const LabelledBytes& /*labelled*/) override {}
    void OnCutToken(const CutToken& /*token*/) override {}
    void OnFinding(const FramingFinding& finding) override { finding_ = finding; }
    void OnQueueFull(const CutToken& /*token*/) override {}
    FramingFinding finding_;
  } keeper;
  FramingCheck check(Settings(), &keeper);
  check.OnBytes("ab\rcd\r");
  check.OnDriverToken({"ab", 2, false});
  check.OnDriverToken({"c", 1, false});
  check.OnSilence(500);
  EXPECT_EQ(keeper.finding_.kind, FramingFinding::Kind::kDifferent);
  EXPECT_EQ(keeper.finding_.driverBytes, "c");
  EXPECT_EQ(keeper.finding_.modelBytes, "cd");
  EXPECT_EQ(keeper.finding_.offset, 3U);
}

TEST_F(FramingCheckTest, AFullQueueIsNoFinding) {
  check_.ChangeSettings(Settings(2));
  Silence();
  Line("0\r");
  Take("0");
  Line("a\rb\rc\rd\r");
  Take("c");
  Take("d");
  Silence();
  Empty();
  EXPECT_EQ(log_.Text(), "full a\nfull b\n");
  ExpectComparing(3);
}

TEST_F(FramingCheckTest, AFullQueueOfEqualTokensIsNoFinding) {
  check_.ChangeSettings(Settings(2));
  Silence();
  Line("a\ra\ra\ra\r");
  Take("a");
  Take("a");
  Silence();
  Empty();
  EXPECT_EQ(log_.Text(), "full a\nfull a\n");
  Line("b\r");
  Take("b");
  Silence();
  EXPECT_EQ(check_.Findings(), 0U);
}

TEST_F(FramingCheckTest, PlainTokensAreComparedUpToTheirFirstZeroByte) {
  Line(std::string("ab\0c\rab\0c\rab\0c\r", 15));
  check_.OnDriverToken({"ab", 4, true});
  check_.OnDriverToken({"ab", 5, true});
  check_.OnDriverToken({"ab", 2, false});
  Silence();
  EXPECT_EQ(check_.ComparedTokens(), 1U);
  EXPECT_EQ(check_.Findings(), 1U);
}

TEST_F(FramingCheckTest, ChangedSettingsStartAgainAtTheNextSilence) {
  Line("a\r");
  Take("a");
  Line("b\rc");
  check_.Interrupt();
  check_.ChangeSettings(Settings(100, "\n"));
  EXPECT_FALSE(check_.IsComparing());
  // Which settings hold for these is not known.
  Take("b");
  Line("\rd\ne\r");
  Take("d");
  Silence();
  Line("f\ng\n");
  Take("e\r");
  Take("f");
  Silence();
  EXPECT_TRUE(check_.IsComparing());
  Take("x");
  Silence();
  EXPECT_EQ(log_.Text(), "the driver has \"x\" where \"g\" is expected\n");
}

TEST_F(FramingCheckTest, OldTokensEqualToNewOnesDoNotMislead) {
  check_.Interrupt();
  Silence();
  Line("a\r");
  // Two of them were queued while nothing was compared.
  Take("a");
  Take("a");
  Take("a");
  Silence();
  Line("b\r");
  Take("b");
  Silence();
  Line("c\r");
  Take("d");
  Silence();
  EXPECT_EQ(log_.Text(), "the driver has \"d\" where \"c\" is expected\n");
}

TEST_F(FramingCheckTest, AClosedPortStartsAgain) {
  Line("a\rb");
  check_.OnDisconnected();
  EXPECT_FALSE(check_.IsComparing());
  Take("a");
  Silence();
  Line("c\r");
  Take("c");
  Silence();
  EXPECT_EQ(log_.Text(), "");
  EXPECT_TRUE(check_.IsComparing());
}

TEST_F(FramingCheckTest, ALineWithoutSilenceKeepsItsMemoryBounded) {
  for (int i = 0; i < 200000; ++i) {
    Line("a\r");
    Take("b");
  }
  EXPECT_GE(check_.Findings(), 1U);
  EXPECT_LT(check_.Findings(), 20U);
}

// The driver and its reader, run in random order; the line's blocks come late.
TEST(FramingCheckRandom, AQueueThatOverflowsGivesNoFinding) {
  for (unsigned int seed = 1; seed <= 200; ++seed) {
    std::mt19937 random(seed);
    const std::size_t queueTokens = 1 + random() % 5;
    FramingSettings settings;
    settings.rxSuffix = "\r";
    settings.queueTokens = static_cast<int>(queueTokens);
    CheckLog log;
    FramingCheck check(settings, &log);
    std::deque<std::string> queue;
    std::string block;  // served, not told yet
    for (int step = 0; step < 3000; ++step) {
      switch (random() % 8) {
        case 0:
        case 1:
        case 2: {
          const std::string token(1, static_cast<char>('a' + random() % 3));
          block += token + "\r";
          if (queue.size() >= queueTokens) {
            queue.pop_front();
          }
          queue.push_back(token);
          break;
        }
        case 3:
          check.OnBytes(block);
          block.clear();
          break;
        case 4:
          check.OnBytes(block);
          block.clear();
          check.OnSilence(500);
          break;
        default:
          if (queue.empty()) {
            check.OnEmptyQueue();
          } else {
            check.OnDriverToken({queue.front(), queue.front().size(), false});
            queue.pop_front();
          }
      }
    }
    EXPECT_EQ(check.Findings(), 0U)
        << "seed " << seed << ", queue of " << queueTokens << "\n"
        << log.Text().substr(log.Text().rfind("the driver") == std::string::npos
                                 ? 0
                                 : log.Text().rfind("the driver"));
    EXPECT_GT(check.ComparedTokens(), 0U);
  }
}

}  // namespace
