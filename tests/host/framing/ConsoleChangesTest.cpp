// SPDX-License-Identifier: Apache-2.0
// Prefix, suffix and gap changed through the driver's console in the middle of frames: the host's
// labelling must change over at the same byte as the driver.
#include <gtest/gtest.h>

#include <cstdio>
#include <map>
#include <random>

#include "host/framing/ReplayHost.h"
#include "host/runtime/HostTag.h"
#include "interfaces/IProtocol7.h"
#include "tests/host/framing/LabelLog.h"
#include "tests/host/support/PluginConfiguration.h"
#include "tests/support/PluginUnderTest.h"

namespace {

constexpr int kGapMs = 500;

struct Change {
  bool isPrefix = false;
  std::string hexText;
};

// The changes by the number of the byte, from 1 on, in front of which they are made.
using Changes = std::map<std::size_t, Change>;

// What the driver makes of the line; 02 and 03 are its prefix and suffix at the start.
std::vector<std::string> DriverTokens(const LineScript& script, const Changes& changes) {
  ReplayHost host(&script);
  PluginUnderTest plugin;
  EXPECT_EQ(plugin.Init(&host), 1);
  IProtocol* const protocol = plugin.Protocols()->CreateProtocol("LOKA");
  const std::string configuration =
      TestConfiguration("rx_prefix=02 rx_suffix=03 hex_tokens=true token_queue_size=10000");
  EXPECT_NE(protocol->Config(configuration.c_str()), 0);
  EXPECT_NE(protocol->Start(), 0);
  host.Port().SetBeforeByte([&](std::size_t number) {
    const auto change = changes.find(number);
    if (change == changes.end()) {
      return;
    }
    char reply[100] = {};
    const std::string command =
        (change->second.isPrefix ? "set_rxPrefix " : "set_rxSuffix ") + change->second.hexText;
    EXPECT_TRUE(protocol->DoCommand(command.c_str(), reply, sizeof(reply))) << reply;
  });
  host.Task().Run();
  std::vector<std::string> tokens;
  {
    const HostTag available(protocol, protocol->CreateTag("0?tokens_available?unsignedInt"),
                            nullptr);
    const HostTag token(protocol, protocol->CreateTag("0?rx_token?string-2100"), nullptr);
    HostTag acknowledge(protocol, protocol->CreateTag("0?token_ack?boolean"), nullptr);
    unsigned int left = 0;
    EXPECT_TRUE(available.ReadNumber(&left));
    for (; left > 0; --left) {
      std::string text;
      EXPECT_TRUE(token.ReadText(&text));
      EXPECT_TRUE(acknowledge.WriteNumber(1));
      tokens.push_back(BytesOfHexText(text));
    }
  }
  EXPECT_NE(protocol->Stop(), 0);
  plugin.Protocols()->DeleteProtocol(protocol);
  return tokens;
}

std::vector<std::string> ModelTokens(const LineScript& script, const Changes& changes) {
  FramingSettings settings;
  settings.rxPrefix = "\x02";
  settings.rxSuffix = "\x03";
  LabelLog log;
  ByteLabeller labeller(settings, &log);
  std::size_t number = 0;
  for (const LineEvent& event : script) {
    if (event.bytes.empty()) {
      labeller.OnSilence(kGapMs);
    }
    for (const char byte : event.bytes) {
      const auto change = changes.find(++number);
      if (change != changes.end()) {
        (change->second.isPrefix ? settings.rxPrefix : settings.rxSuffix) =
            BytesOfHexText(change->second.hexText);
        // The driver asks for this byte with the settings that it had.
        if (number == 1) {
          labeller.OnBytes("");
        }
        labeller.ChangeSettings(settings);
      }
      labeller.OnBytes(std::string(1, byte));
    }
  }
  labeller.OnSilence(kGapMs);
  EXPECT_TRUE(log.IsGapless());
  std::vector<std::string> tokens;
  for (const CutToken& token : log.Tokens()) {
    tokens.push_back(token.bytes);
  }
  return tokens;
}

TEST(ConsoleChanges, HoldForTheLabellingAsForTheDriver) {
  // Texts that only the console takes are among them: half a byte and a letter that is no digit.
  const std::vector<std::string> kTexts = {"none", "02",   "03", "04",   "0202",
                                           "0203", "0302", "7",  "0303", "0g"};
  std::size_t tokens = 0;
  std::size_t differences = 0;
  for (unsigned int seed = 1; seed <= 300; ++seed) {
    std::mt19937 random(seed);
    LineScript script;
    Changes changes;
    std::size_t number = 0;
    for (int i = 0; i < 600; ++i) {
      if (random() % 12 == 0) {
        script.push_back({});
        continue;
      }
      script.push_back({std::string(1, static_cast<char>(2 + random() % 3)), 0});
      ++number;
      if (random() % 20 == 0) {
        changes[number] = {random() % 2 == 0, kTexts[random() % kTexts.size()]};
      }
    }
    const auto actual = DriverTokens(script, changes);
    tokens += actual.size();
    if (actual != ModelTokens(script, changes) && ++differences <= 3) {
      ADD_FAILURE() << "seed " << seed;
    }
  }
  EXPECT_EQ(differences, 0U);
  EXPECT_GT(tokens, 5000U);
  std::printf("300 lines, %zu tokens, %zu differences\n", tokens, differences);
}

}  // namespace
