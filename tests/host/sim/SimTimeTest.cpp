// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "host/events/WallClock.h"
#include "tests/host/sim/HostEnd.h"
#include "tests/host/sim/SimProcess.h"
#include "tests/host/support/PluginConfiguration.h"
#include "tests/host/support/TestLimit.h"

namespace {

constexpr std::size_t kEverything = 100000000;

std::int64_t TimeOf(const SimProcess::Json& event) {
  std::int64_t timeUs = -1;
  EXPECT_TRUE(ParseUtcText(event["t"], &timeUs)) << event;
  return timeUs;
}

// The gauge has nothing but silence around its values. Margin: 300 ms between two of them against a
// gap of 50 ms, so the machine may be late by up to 250 ms.
TEST(SimTime, SilenceFramesTheValuesOfTheGauge) {
  SimProcess sim({"gauge", "--every", "300", "--count", "6"});
  ProgramRun sub({"sub", "-F", "%t  %l  \"%p\"  %x", "--port", "com1=" + sim.LinkPath(),
                  "--no-store", "--config", TestConfiguration("gap=50")});
  sim.Finish();
  EXPECT_EQ(sim.Run().Status(), 0);
  const auto sent = sim.Events("sent");
  ASSERT_EQ(sent.size(), 6U);
  for (const SimProcess::Json& event : sent) {
    const std::string line = sub.Line();
    EXPECT_NE(line.find("\"" + event["text"].get<std::string>() + "\""), std::string::npos) << line;
  }
}

// A pause inside a value that is longer than the gap cuts it. Margin: 200 ms against 50 ms.
TEST(SimTime, ASplitLongerThanTheGapCutsAValue) {
  SimProcess sim({"gauge", "--every", "600", "--count", "2", "--split", "2@200ms"});
  ProgramRun sub({"sub", "-F", "%t  %l  \"%p\"  %x", "--port", "com1=" + sim.LinkPath(),
                  "--no-store", "--config", TestConfiguration("gap=50")});
  sim.Finish();
  for (const SimProcess::Json& event : sim.Events("sent")) {
    EXPECT_EQ(event["fault"], SimProcess::Json({"split"}));
    std::string whole;
    for (int piece = 0; piece < 2; ++piece) {
      const std::string line = sub.Line();
      const std::size_t begin = line.find('"') + 1;
      whole += line.substr(begin, line.find('"', begin) - begin);
    }
    EXPECT_EQ(whole, event["text"]);
  }
}

// 100 messages at 20 ms. The last one is due 1980 ms behind the first one; drift of only 1 ms a
// message would make it 2080. Margin: 60 ms for a late first or last message.
TEST(SimTime, TheIntervalDoesNotDrift) {
  SimProcess sim({"scale", "--every", "20", "--count", "100"});
  const HostEnd host(sim.LinkPath());
  (void)host.Read(kEverything, kLimitMs);
  sim.Finish();
  const auto sent = sim.Events("sent");
  ASSERT_EQ(sent.size(), 100U);
  const auto missedMs = sim.Events("end")[0]["missed"].get<std::int64_t>() * 20;
  const std::int64_t tookMs = (TimeOf(sent.back()) - TimeOf(sent.front())) / 1000 - missedMs;
  EXPECT_NEAR(static_cast<double>(tookMs), 1980, 60);
}

// 60 bytes at 1200 baud take 500 ms, however they are read; they never come earlier. Margin: up to
// 5 s later on a busy machine.
TEST(SimTime, BaudPacesTheBytes) {
  SimProcess sim({"barcode", "--text", std::string(58, 'x'), "--count", "1", "--baud", "1200"});
  const HostEnd host(sim.LinkPath());
  ASSERT_EQ(host.Read(1, kLimitMs).size(), 1U);
  const auto begin = std::chrono::steady_clock::now();
  EXPECT_EQ(host.Read(59, kLimitMs).size(), 59U);
  const std::chrono::duration<double, std::milli> took = std::chrono::steady_clock::now() - begin;
  // The first byte may have been seen late; it is 20 ms of slack.
  EXPECT_GT(took.count(), 470);
  EXPECT_LT(took.count(), 5500);
}

// Margin: ends behind 1 s, at most 10 s late.
TEST(SimTime, ForEndsTheRun) {
  const auto begin = std::chrono::steady_clock::now();
  SimProcess sim({"modem", "--for", "1"});
  sim.Finish();
  EXPECT_EQ(sim.Run().Status(), 0);
  const auto took = std::chrono::steady_clock::now() - begin;
  EXPECT_GE(took, std::chrono::seconds(1));
  EXPECT_LT(took, std::chrono::seconds(11));
}

}  // namespace
