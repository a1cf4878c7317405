// SPDX-License-Identifier: Apache-2.0
// A device that sends without pause, read by somebody or by nobody. Every token that was sent is
// accounted for: shown, or dropped by the full queue, or among the bytes that were told as missed.
#include <gtest/gtest.h>

#include <atomic>
#include <chrono>
#include <thread>

#include "host/port/PseudoTerminal.h"
#include "tests/host/faults/MemoryOf.h"
#include "tests/host/faults/RunBench.h"
#include "tests/support/Sanitized.h"

namespace {

using Json = nlohmann::json;

#ifdef LOKA_SANITIZED
constexpr long kMemoryLimitKib = 1024L * 1024;  // a sanitizer keeps what was given back
#else
constexpr long kMemoryLimitKib = 100L * 1024;
#endif

// Sends numbered tokens for as long as it lives.
class EndlessDevice {
 public:
  explicit EndlessDevice(const PseudoTerminal* line) : line_(line), thread_([this] { Run(); }) {}
  ~EndlessDevice() { (void)Stop(); }
  EndlessDevice(const EndlessDevice&) = delete;
  EndlessDevice& operator=(const EndlessDevice&) = delete;

  // How many the line took.
  std::uint64_t Stop() {
    isEnding_.store(true);
    if (thread_.joinable()) {
      thread_.join();
    }
    return sent_.load();
  }
  std::uint64_t Sent() const { return sent_.load(); }

 private:
  void Run() {
    while (!isEnding_.load()) {
      // One frame at a time, so that none is cut off at the end.
      const std::string frame = "\x02" + std::to_string(sent_.load() + 1) + "\x03";
      if (!line_->Send(frame, Deadline::After(kTakenLimitMs))) {
        return;
      }
      ++sent_;
    }
  }

  static constexpr int kTakenLimitMs = 2000;  // for one frame, where somebody takes them

  const PseudoTerminal* const line_;
  std::atomic<bool> isEnding_{false};
  std::atomic<std::uint64_t> sent_{0};
  std::thread thread_;
};

// What the first `count` tokens are on the line.
std::uint64_t BytesOfTokens(std::uint64_t count) {
  std::uint64_t bytes = 0;
  for (std::uint64_t number = 1; number <= count; ++number) {
    bytes += std::to_string(number).size() + 2;
  }
  return bytes;
}

constexpr std::uint64_t kLeastFrameBytes = 3;

TEST(Flood, ADeviceThatNeverPausesIsReadAndCommandsAreAnsweredMeanwhile) {
  constexpr int kAnswers = 10;
  constexpr std::uint64_t kTokens = 1000;
  const RunBench bench;
  const PseudoTerminal line;
  const auto run = bench.BeginReady(line.Path(), "rx_prefix=02 rx_suffix=03 token_queue_size=100");
  EndlessDevice device(&line);
  ControlClient client(bench.SocketFile());
  const Deadline atLeast = Deadline::After(700);
  const Deadline limit = Deadline::After(ProgramRun::kLimitMs);
  int answers = 0;
  while (!atLeast.HasPassed() ||
         ((answers < kAnswers || device.Sent() < kTokens) && !limit.HasPassed())) {
    const Json answer = client.Ask(R"({"op":"read","uri":"0?tokens_available?unsignedInt"})");
    ASSERT_TRUE(answer.value("ok", false)) << answer.dump();
    ++answers;
    Deadline::After(20).Sleep();
  }
  EXPECT_GE(answers, kAnswers);
  const std::uint64_t sent = device.Stop();
  EXPECT_GE(sent, kTokens);
  const std::uint64_t sentBytes = BytesOfTokens(sent);
  ASSERT_TRUE(bench.AwaitCount("received_bytes", sentBytes - bench.Count("missed_bytes")));
  const std::uint64_t missedBytes = bench.Count("missed_bytes");
  // What a slow machine was told as missed may hold so many tokens, and cuts one at each end.
  const std::uint64_t missed = missedBytes == 0 ? 0 : missedBytes / kLeastFrameBytes + 2;
  const Deadline end = Deadline::After(ProgramRun::kLimitMs);
  std::uint64_t shown = 0;
  std::uint64_t dropped = 0;
  while (shown + dropped + missed < sent && !end.HasPassed()) {
    Deadline::After(20).Sleep();
    shown = bench.Count("tokens");
    dropped = bench.Count("drops/queue-full");
  }
  std::printf("%llu sent, %llu shown, %llu dropped and told, %llu bytes told as missed\n",
              static_cast<unsigned long long>(sent), static_cast<unsigned long long>(shown),
              static_cast<unsigned long long>(dropped),
              static_cast<unsigned long long>(missedBytes));
  EXPECT_LE(shown + dropped, sent);
  EXPECT_GE(shown + dropped + missed, sent);
  EXPECT_EQ(bench.Count("findings"), 0U);
  if (missedBytes == 0) {
    EXPECT_EQ(bench.Count("drops/no-prefix"), 0U);
  }
  EXPECT_LT(MemoryKibOf(run->ProcessId(), "VmHWM"), kMemoryLimitKib);
}

TEST(Flood, ASignalEndsItWhileTheDeviceGoesOn) {
  const RunBench bench;
  const PseudoTerminal line;
  const auto run = bench.BeginReady(line.Path(), "rx_prefix=02 rx_suffix=03");
  const EndlessDevice device(&line);
  ASSERT_TRUE(bench.AwaitCount("received_bytes", 100000));
  run->Signal(SIGTERM);
  EXPECT_EQ(run->Status(), 128 + SIGTERM);
}

// The pipe behind "loka sub" is full: tokens stay in the driver's queue, the oldest ones go when it
// is full, and the reader is told about each of them once it reads again.
TEST(Flood, APipeThatIsNotReadLosesNothingUnseen) {
  const RunBench bench;
  const PseudoTerminal line;
  const auto sub =
      bench.Command({"sub", line.Path(), "--no-attach", "-j", "--no-store", "--config",
                     TestConfiguration("rx_prefix=02 rx_suffix=03 token_queue_size=50")});
  ASSERT_TRUE(
      line.Send("\x02"
                "first\x03",
                Deadline::After(ProgramRun::kLimitMs)));
  while (sub->Line().find("\"first\"") == std::string::npos) {
  }
  EndlessDevice device(&line);
  Deadline::After(700).Sleep();
  const std::uint64_t sent = device.Stop();
  const long memoryKib = MemoryKibOf(sub->ProcessId(), "VmHWM");
  EXPECT_LT(memoryKib, kMemoryLimitKib);
  std::uint64_t shown = 0;
  std::uint64_t dropped = 0;
  std::uint64_t last = 0;
  std::uint64_t accountedBytes = 0;
  std::uint64_t missedBytes = 0;
  const std::uint64_t sentBytes = BytesOfTokens(sent);
  // The tokens that waited at the end can be among the missed bytes as well, and so can the frame
  // that was cut off by them.
  constexpr std::uint64_t kBothBytes = 60 * 10;
  while (last < sent || accountedBytes + missedBytes + kBothBytes < sentBytes) {
    const std::string text = sub->Line();
    ASSERT_NE(text, "(none)") << sub->Errors();
    const Json event = Json::parse(text);
    const std::string kind = event.value("ev", "");
    EXPECT_NE(kind, "finding") << text;
    if (kind == "token") {
      const std::uint64_t number = std::stoull(event.value("text", "0"));
      EXPECT_GT(number, last);
      last = number;
      ++shown;
      accountedBytes += event.value("text", "").size() + 2;
    } else if (kind == "drop" && event.value("why", "") == "queue-full") {
      ++dropped;
      accountedBytes += event.value("hex", "").size() / 2 + 2;
    } else if (kind == "note") {
      missedBytes += event.value("missed", std::uint64_t{0});
    }
  }
  EXPECT_GE(accountedBytes + missedBytes + kBothBytes, sentBytes);
  EXPECT_LE(accountedBytes + missedBytes, sentBytes + kBothBytes);
  EXPECT_GT(dropped, 0U);
  std::printf("%llu sent, %llu shown, %llu dropped and told, %llu bytes told as missed, %ld KiB\n",
              static_cast<unsigned long long>(sent), static_cast<unsigned long long>(shown),
              static_cast<unsigned long long>(dropped),
              static_cast<unsigned long long>(missedBytes), memoryKib);
}

}  // namespace
