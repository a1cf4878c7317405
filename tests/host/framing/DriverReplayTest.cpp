// SPDX-License-Identifier: Apache-2.0
// The host's labelling against the loaded driver on long random lines.
#include <gtest/gtest.h>

#include <cstdio>
#include <random>

#include "host/framing/ConfigEdit.h"
#include "host/framing/DriverReplay.h"
#include "tests/host/framing/LabelLog.h"
#include "tests/host/support/PluginConfiguration.h"
#include "tests/support/PluginLibrary.h"

namespace {

constexpr int kReplayGapMs = 20;

ReplayResult Replay(const std::string& configuration, const LineScript& script) {
  return ReplayThroughDriver(PluginLibrary::DefaultPath(), configuration, script);
}

std::vector<std::string> Expected(const std::string& configuration, const LineScript& script) {
  LabelLog log;
  ByteLabeller labeller(FramingOfConfiguration(configuration), &log);
  for (const LineEvent& event : script) {
    if (event.bytes.empty()) {
      labeller.OnSilence(kReplayGapMs);
    } else {
      labeller.OnBytes(event.bytes);
    }
  }
  labeller.OnSilence(kReplayGapMs);
  EXPECT_TRUE(log.IsGapless());
  EXPECT_EQ(labeller.OpenBytes(), 0U);
  std::vector<std::string> tokens;
  for (const CutToken& token : log.Tokens()) {
    tokens.push_back(token.bytes);
  }
  return tokens;
}

// A line of bytes over a small alphabet, silences in between.
LineScript RandomLine(std::mt19937* random, std::size_t symbols, int silencePercent) {
  std::uniform_int_distribution<int> percent(0, 99);
  std::uniform_int_distribution<int> byte(0, static_cast<int>(symbols) - 1);
  std::uniform_int_distribution<std::size_t> length(0, 4000);
  LineScript script;
  for (std::size_t left = length(*random); left > 0; --left) {
    if (percent(*random) < silencePercent) {
      script.push_back({});
      continue;
    }
    if (script.empty() || script.back().bytes.empty()) {
      script.push_back({});
    }
    script.back().bytes += static_cast<char>(byte(*random) + 2);
  }
  return script;
}

std::string RandomHexText(std::mt19937* random, std::size_t symbols) {
  std::uniform_int_distribution<int> length(0, 4);
  std::uniform_int_distribution<int> byte(0, static_cast<int>(symbols) - 1);
  std::string text;
  for (int left = length(*random); left > 0; --left) {
    text += "0" + std::to_string(byte(*random) + 2);
  }
  return text;
}

TEST(DriverReplay, CutsLikeTheDriverInTheNamedCases) {
  const std::string framing = TestConfiguration("rx_prefix=0202 rx_suffix=03");
  EXPECT_EQ(Replay(framing, {{"\x02\x05\x02\x02"
                              "A\x03",
                              0}})
                .tokens,
            std::vector<std::string>({"A"}));
  EXPECT_EQ(
      Replay(TestConfiguration("gap=100"), {{"a", 0}, {"", 99}, {"b", 0}, {"", 100}, {"c", 0}})
          .tokens,
      std::vector<std::string>({"ab", "c"}));
  EXPECT_EQ(Replay(TestConfiguration(""), {{std::string("\0x", 2), 0}}).tokens,
            std::vector<std::string>({std::string("\0x", 2)}));
  EXPECT_TRUE(Replay(framing, {}).tokens.empty());
}

TEST(DriverReplay, RefusalsKeepTheDriversWords) {
  const ReplayResult refused = Replay("CfgVer=1 model=1", {});
  EXPECT_EQ(refused.status, ExitStatus::kConfiguration);
  EXPECT_EQ(refused.text, "Parser: parameter 'port' is not found");
  // What the replay changes for itself does not hide what is wrong.
  EXPECT_EQ(Replay(TestConfiguration("hex_tokens=maybe"), {}).status, ExitStatus::kConfiguration);
  EXPECT_EQ(ReplayThroughDriver("/nowhere/lib.so", TestConfiguration(""), {}).status,
            ExitStatus::kPlugin);
}

TEST(DriverReplay, MoreTokensInOnePassThanTheQueueHolds) {
  const ReplayResult replay =
      Replay(TestConfiguration("rx_prefix=02"), {{std::string(30001, '\x02'), 0}});
  EXPECT_EQ(replay.tokens.size(), 30000U);
}

class RandomLines : public ::testing::TestWithParam<unsigned int> {};

TEST_P(RandomLines, GiveTheDriversTokens) {
  std::mt19937 random(GetParam());
  std::size_t bytes = 0;
  std::size_t tokens = 0;
  std::size_t differences = 0;
  constexpr int kLines = 150;
  for (int i = 0; i < kLines; ++i) {
    const std::size_t symbols = 2 + random() % 3;
    const std::string configuration =
        TestConfiguration("gap=20 rx_prefix=" + RandomHexText(&random, symbols) +
                          " rx_suffix=" + RandomHexText(&random, symbols));
    // Now and then hardly any silence, so that frames grow past 1000 bytes.
    const LineScript script = RandomLine(&random, symbols, i % 3 == 0 ? 0 : 1 + i % 20);
    const ReplayResult replay = Replay(configuration, script);
    ASSERT_TRUE(replay.IsDone()) << replay.text;
    for (const LineEvent& event : script) {
      bytes += event.bytes.size();
    }
    tokens += replay.tokens.size();
    if (replay.tokens != Expected(configuration, script) && ++differences <= 3) {
      ADD_FAILURE() << "seed " << GetParam() << " line " << i << ": " << configuration;
    }
  }
  EXPECT_EQ(differences, 0U);
  EXPECT_GT(tokens, 0U);
  std::printf("seed %u: %d lines, %zu bytes, %zu tokens, %zu differences\n", GetParam(), kLines,
              bytes, tokens, differences);
}

INSTANTIATE_TEST_SUITE_P(Seeds, RandomLines, ::testing::Range(1U, 9U));

}  // namespace
