// SPDX-License-Identifier: Apache-2.0
// "loka run" is killed again and again, at any moment, while a client stages and applies settings.
// Behind each kill the store is whole, all settings in it are of one SP_Done, and that is the last
// one that was confirmed or the one that was being carried out.
#include <gtest/gtest.h>
#include <unistd.h>

#include <csignal>
#include <cstdio>
#include <random>
#include <thread>
#include <vector>

#include "host/port/PseudoTerminal.h"
#include "host/store/SqliteFile.h"
#include "tests/host/faults/RunBench.h"
#include "tests/support/Sanitized.h"

namespace {

// How much longer than otherwise a set of values takes.
#ifdef LOKA_SANITIZED
constexpr int kSlowness = 5;
#else
constexpr int kSlowness = 1;
#endif

using Json = nlohmann::json;

constexpr int kKillsPerSeries = 50;
// The first ones of a series come while the store is being made or opened.
constexpr int kKillsAtStart = 8;
constexpr const char* kPortName = "com1";

std::string HexOf(int round) {
  char text[16];
  (void)std::snprintf(text, sizeof text, "%06X", static_cast<unsigned int>(round));
  return text;
}

// Everything that one SP_Done stores in round n; the round can be read off most of the values.
SqliteFile::Values ValuesOf(int round) {
  const bool isOdd = round % 2 != 0;
  const std::string port = kPortName;
  return {{{port, "baud"}, isOdd ? 9600 : 19200},
          {{port, "parity"}, isOdd ? 1 : 2},
          {{port, "stop"}, isOdd ? 1 : 2},
          {{port, "gap"}, 1000 + round},
          {{port, "token_queue_size"}, 2000 + round},
          {{port, "hex_tokens"}, isOdd},
          {{port, "rx_prefix"}, HexOf(round)},
          {{port, "rx_suffix"}, HexOf(round + 1)},
          {{port, "tx_prefix"}, HexOf(round + 2)},
          {{port, "tx_suffix"}, HexOf(round + 3)}};
}

std::string TextOf(const StoredValue& value) {
  if (const auto* const text = std::get_if<std::string>(&value)) {
    return *text;
  }
  const auto* const flag = std::get_if<bool>(&value);
  return std::to_string(flag != nullptr ? static_cast<int>(*flag) : std::get<int>(value));
}

// Stages and applies one round after the other until the instance is gone. The number of the last
// round that was confirmed as stored.
int StoreUntilKilled(const std::string& socketFile, int firstRound) {
  int confirmed = firstRound - 1;
  try {
    ControlClient client(socketFile);
    for (int round = firstRound;; ++round) {
      for (const auto& [key, value] : ValuesOf(round)) {
        const Json stage = {{"op", "stage"}, {"key", key.second}, {"value", TextOf(value)}};
        if (!client.Ask(stage.dump()).value("ok", false)) {
          return confirmed;
        }
      }
      const Json answer = client.Ask(R"({"op":"done"})");
      if (!answer.is_object() || !answer.value("ok", false) ||
          !answer["data"].value("stored", false)) {
        return confirmed;
      }
      confirmed = round;
    }
  } catch (const std::exception&) {
    // Killed before it listened.
    return confirmed;
  }
}

class KillWhileStoring : public testing::TestWithParam<unsigned int> {
 protected:
  // Kills the instance after some time. The last round that was confirmed.
  int RunAndKill(int firstRound, bool isAtStart) {
    std::uniform_int_distribution<int> startUs(0, 25000);
    std::uniform_int_distribution<int> storeUs(0, 40000 * kSlowness);
    const auto run = bench_.Begin(line_.Path(), "autoConnect=false", {"-q"});
    if (isAtStart) {
      usleep(static_cast<useconds_t>(startUs(random_)));
      run->Signal(SIGKILL);
      (void)run->Status();
      return firstRound - 1;
    }
    const Deadline deadline = Deadline::After(ProgramRun::kLimitMs);
    while (!IsListening() && !deadline.HasPassed()) {
      usleep(1000);
    }
    std::thread killer([&, waitUs = storeUs(random_)] {
      usleep(static_cast<useconds_t>(waitUs));
      run->Signal(SIGKILL);
    });
    const int confirmed = StoreUntilKilled(bench_.SocketFile(), firstRound);
    killer.join();
    EXPECT_EQ(run->Status(), 128 + SIGKILL) << run->Errors();
    return confirmed;
  }

  bool IsListening() const {
    try {
      const ControlClient client(bench_.SocketFile());
      return true;
    } catch (const std::exception&) {
      return false;
    }
  }

  RunBench bench_;
  PseudoTerminal line_;
  std::mt19937 random_{GetParam()};
};

TEST_P(KillWhileStoring, LeavesAWholeStoreWithAllThatWasConfirmed) {
  int stored = 0;
  int applied = 0;
  for (int kill = 0; kill < kKillsPerSeries; ++kill) {
    const int confirmed = RunAndKill(stored + 1, kill < kKillsAtStart);
    std::string error;
    const auto file = SqliteFile::Open(bench_.StoreFile(), &error);
    ASSERT_NE(file, nullptr) << "kill " << kill << ": " << error;
    SqliteFile::Values values;
    ASSERT_TRUE(file->ReadAll(&values, &error)) << error;
    if (values.empty()) {
      ASSERT_EQ(confirmed, 0) << "kill " << kill;
      continue;
    }
    const int round = std::get<int>(values.at({kPortName, "gap"})) - 1000;
    ASSERT_EQ(values, ValuesOf(round)) << "kill " << kill << " left half of round " << round;
    ASSERT_GE(round, confirmed) << "kill " << kill << " lost what was confirmed";
    ASSERT_LE(round, confirmed + 1) << "kill " << kill;
    applied += round - stored;
    stored = round;
  }
  // Enough kills came while something was going on; a slow program gets less done in between.
  EXPECT_GT(applied, kKillsPerSeries / 10);
  RecordProperty("applied", applied);
  std::printf("%d kills, %d times settings were applied and stored\n", kKillsPerSeries, applied);
}

INSTANTIATE_TEST_SUITE_P(Seeds, KillWhileStoring, testing::Values(1U, 2U, 3U, 4U),
                         [](const auto& seed) { return "Seed" + std::to_string(seed.param); });

}  // namespace
