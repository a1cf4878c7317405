// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <algorithm>
#include <chrono>

#include "host/port/PseudoTerminal.h"
#include "host/runtime/HostSession.h"
#include "tests/host/port/CountingObserver.h"
#include "tests/host/support/PluginConfiguration.h"
#include "tests/host/support/TestLimit.h"
#include "tests/support/PluginLibrary.h"

namespace {

constexpr int kGapMs = 200;
// The margin that a disconnect has beyond one time-out of the port.
constexpr int kMarginMs = 100;
constexpr int kRounds = 100;

// The receive task takes the port semaphore again right after it lets it go. A disconnect must get
// in between, at the next time-out at the latest, each time.
TEST(Disconnect, ReturnsWithinOneTimeOutWhileTheLineIsSilent) {
  const PseudoTerminal line;
  CountingObserver observer;
  HostOptions options;
  options.pluginFile = PluginLibrary::DefaultPath();
  options.observer = &observer;
  std::string error;
  ASSERT_TRUE(options.ports.Add(line.Path(), &error));
  HostSession session(options);
  ASSERT_TRUE(session.Open().IsDone());
  ASSERT_TRUE(
      session.Configure(TestConfiguration("rx_suffix=03 gap=" + std::to_string(kGapMs))).IsDone());
  ASSERT_TRUE(session.Start().IsDone());
  const auto connect = session.CreateTag("0?connect?boolean", &error);
  ASSERT_NE(connect, nullptr) << error;
  std::chrono::steady_clock::duration longest{};
  for (int round = 0; round < kRounds; ++round) {
    ASSERT_TRUE(observer.AwaitPause(kLimitMs));
    const auto begin = std::chrono::steady_clock::now();
    ASSERT_TRUE(connect->WriteNumber(0)) << connect->Error();
    const auto took = std::chrono::steady_clock::now() - begin;
    longest = std::max(longest, took);
    ASSERT_LE(took, std::chrono::milliseconds(kGapMs + kMarginMs)) << "round " << round;
    ASSERT_TRUE(connect->WriteNumber(1)) << connect->Error();
  }
  RecordProperty(
      "longest_ms",
      static_cast<int>(std::chrono::duration_cast<std::chrono::milliseconds>(longest).count()));
}

}  // namespace
