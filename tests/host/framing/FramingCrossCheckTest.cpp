// SPDX-License-Identifier: Apache-2.0
// The host's labelling against the loaded driver: every short line over a small alphabet, for every
// prefix and suffix of the list.
#include <gtest/gtest.h>

#include <cstdio>

#include "interfaces/IProtocol7.h"
#include "interfaces/ITag.h"
#include "tests/host/framing/LabelLog.h"
#include "tests/host/support/PluginConfiguration.h"
#include "tests/support/PluginUnderTest.h"
#include "tests/support/ScriptedHost.h"

namespace {

#if defined(__SANITIZE_THREAD__) || defined(__SANITIZE_ADDRESS__)
#define LOKA_SLOW_CODE 1
#elif defined(__has_feature)
#if __has_feature(address_sanitizer) || __has_feature(thread_sanitizer)
#define LOKA_SLOW_CODE 1
#endif
#endif
#ifdef LOKA_SLOW_CODE
constexpr std::size_t kLongest = 4;  // instrumented code is ten times slower
#else
constexpr std::size_t kLongest = 7;
#endif

constexpr int kCheckGapMs = 1;
constexpr int kPause = -1;
constexpr std::size_t kQueueTokens = 10000;
constexpr int kTokenCharacters = 2100;

// The empty one, single bytes, repetitions, and prefixes that begin again inside themselves.
const std::vector<std::string> kPrefixes = {"",     "02",   "00",     "0202",
                                            "0203", "0302", "020203", "020302"};
const std::vector<std::string> kSuffixes = {"",     "03",   "02",     "0303",
                                            "0203", "0302", "030203", "030303"};
const std::vector<int> kSymbols = {0x02, 0x03, 0x00, kPause};

// The plug-in on a line in memory, in hex mode so that every byte value comes through.
class ScriptedDriver {
 public:
  ScriptedDriver() {
    host_.Log().SetRecording(false);
    EXPECT_EQ(plugin_.Init(&host_), 1);
    protocol_ = static_cast<IProtocol7*>(
        plugin_.Protocols()->CreateProtocol("LOKA")->ConvertTo("IProtocol7"));
  }
  ~ScriptedDriver() {
    protocol_->Stop();
    plugin_.Protocols()->DeleteProtocol(protocol_);
  }
  ScriptedDriver(const ScriptedDriver&) = delete;
  ScriptedDriver& operator=(const ScriptedDriver&) = delete;

  bool Start(const std::string& prefix, const std::string& suffix) {
    const std::string configuration =
        TestConfiguration("hex_tokens=true token_queue_size=10000 gap=1 rx_prefix=" + prefix +
                          " rx_suffix=" + suffix);
    if (protocol_->Config(configuration.c_str()) == 0 || protocol_->Start() == 0) {
      return false;
    }
    token_ = protocol_->CreateTag("0?rx_token?string-2100");
    available_ = protocol_->CreateTag("0?tokens_available?unsignedInt");
    acknowledge_ = protocol_->CreateTag("0?token_ack?boolean");
    return token_ != nullptr && available_ != nullptr && acknowledge_ != nullptr;
  }

  std::vector<std::string> Receive(const std::vector<int>& line) {
    for (const int event : line) {
      if (event == kPause) {
        host_.Line().Silence(kCheckGapMs);
      } else {
        host_.Line().Feed(std::string(1, static_cast<char>(event)));
      }
    }
    host_.RunUntilSilent();
    std::vector<std::string> tokens;
    for (unsigned int left = Available(); left > 0; --left) {
      tokens.push_back(Take());
    }
    return tokens;
  }

 private:
  unsigned int Available() {
    unsigned char bytes[4] = {};
    EXPECT_NE(protocol_->Read(available_, bytes), 0);
    return bytes[0] + bytes[1] * 256U;
  }

  std::string Take() {
    char text[kTokenCharacters] = {};
    EXPECT_NE(protocol_->Read(token_, reinterpret_cast<unsigned char*>(text)), 0);
    const unsigned char on = 1;
    EXPECT_NE(protocol_->Write(acknowledge_, &on), 0);
    return BytesOfHexText(text);
  }

  ScriptedHost host_;
  PluginUnderTest plugin_;
  IProtocol7* protocol_ = nullptr;
  const ITag* token_ = nullptr;
  const ITag* available_ = nullptr;
  const ITag* acknowledge_ = nullptr;
};

// All lines of up to kLongest symbols, each with a silence behind it.
std::vector<std::vector<int>> AllLines() {
  std::vector<std::vector<int>> lines = {{}};
  for (std::size_t i = 0; i < lines.size(); ++i) {
    if (lines[i].size() == kLongest) {
      break;
    }
    for (const int symbol : kSymbols) {
      lines.push_back(lines[i]);
      lines.back().push_back(symbol);
    }
  }
  for (std::vector<int>& line : lines) {
    line.push_back(kPause);
  }
  return lines;
}

std::string Show(const std::vector<int>& line) {
  std::string text;
  for (const int event : line) {
    text += event == kPause ? "~ " : HexBytes(std::string(1, static_cast<char>(event))) + " ";
  }
  return text;
}

void Feed(const std::vector<int>& line, ByteLabeller* labeller) {
  for (const int event : line) {
    if (event == kPause) {
      labeller->OnSilence(kCheckGapMs);
    } else {
      labeller->OnBytes(std::string(1, static_cast<char>(event)));
    }
  }
}

class FramingCrossCheck : public ::testing::TestWithParam<std::string> {};

TEST_P(FramingCrossCheck, EveryShortLineGivesTheDriversTokens) {
  const std::vector<std::vector<int>> lines = AllLines();
  std::size_t streams = 0;
  std::size_t tokens = 0;
  std::size_t differences = 0;
  for (const std::string& suffix : kSuffixes) {
    ScriptedDriver driver;
    ASSERT_TRUE(driver.Start(GetParam(), suffix));
    FramingSettings settings;
    settings.rxPrefix = BytesOfHexText(GetParam());
    settings.rxSuffix = BytesOfHexText(suffix);
    LabelLog log;
    std::vector<int> batch;  // many lines at a time; the silence behind each keeps them apart
    std::size_t batchLines = 0;
    std::vector<std::string> expected;
    for (std::size_t i = 0; i < lines.size(); ++i) {
      log.Clear();
      ByteLabeller fresh(settings, &log);
      Feed(lines[i], &fresh);
      ASSERT_TRUE(log.IsGapless()) << Show(lines[i]);
      ASSERT_EQ(fresh.OpenBytes(), 0U) << Show(lines[i]);
      for (const CutToken& token : log.Tokens()) {
        expected.push_back(token.bytes);
      }
      batch.insert(batch.end(), lines[i].begin(), lines[i].end());
      ++batchLines;
      ++streams;
      if (batchLines < 200 && expected.size() + kLongest < kQueueTokens && i + 1 < lines.size()) {
        continue;
      }
      const std::vector<std::string> actual = driver.Receive(batch);
      tokens += actual.size();
      if (actual != expected && ++differences <= 3) {
        ADD_FAILURE() << "prefix " << GetParam() << " suffix " << suffix << " lines "
                      << i + 1 - batchLines << " to " << i << ", the last is " << Show(lines[i]);
      }
      batch.clear();
      batchLines = 0;
      expected.clear();
    }
  }
  EXPECT_EQ(differences, 0U);
  EXPECT_GT(tokens, 0U);
  std::printf("prefix %s: %zu lines, %zu tokens, %zu differences\n",
              GetParam().empty() ? "none" : GetParam().c_str(), streams, tokens, differences);
}

INSTANTIATE_TEST_SUITE_P(Prefixes, FramingCrossCheck, ::testing::ValuesIn(kPrefixes),
                         [](const auto& prefix) {
                           return prefix.param.empty() ? "none" : "x" + prefix.param;
                         });

}  // namespace
