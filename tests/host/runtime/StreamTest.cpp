// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <atomic>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <thread>

#include "host/base/Deadline.h"
#include "host/port/PseudoTerminal.h"
#include "host/runtime/HostEvents.h"
#include "host/runtime/HostSession.h"
#include "host/runtime/TokenReader.h"
#include "tests/host/support/PluginConfiguration.h"
#include "tests/support/PluginLibrary.h"

#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
#define LOKA_IS_SANITIZED 1
#elif defined(__has_feature)
#if __has_feature(address_sanitizer) || __has_feature(thread_sanitizer)
#define LOKA_IS_SANITIZED 1
#endif
#endif

namespace {

constexpr int kStreamLimitMs = 60000;
#ifdef LOKA_IS_SANITIZED
constexpr long kDefaultTokens = 50000;
#else
constexpr long kDefaultTokens = 1000000;
#endif

long TokenCount() {
  const char* const text = std::getenv("LOKA_STREAM_TOKENS");
  return text == nullptr ? kDefaultTokens : std::strtol(text, nullptr, 10);
}

// 16 bytes that differ from token to token.
std::string TokenText(long number) {
  char text[24] = {};
  std::snprintf(text, sizeof text, "%016ld", number);
  return text;
}

std::string Framed(long number) { return "\x02" + TokenText(number) + "\x03"; }

class StreamTest : public testing::Test {
 protected:
  void Start(const std::string& configuration) {
    HostOptions options;
    options.pluginFile = PluginLibrary::DefaultPath();
    options.observer = &events_;
    std::string error;
    ASSERT_TRUE(options.ports.Add(line_.Path(), &error));
    session_ = std::make_unique<HostSession>(options);
    ASSERT_TRUE(session_->Open().IsDone());
    ASSERT_TRUE(session_->Configure(TestConfiguration("rx_prefix=02 rx_suffix=03 " + configuration))
                    .IsDone());
    ASSERT_TRUE(session_->Start().IsDone());
  }

  HostEvents events_{nullptr};
  PseudoTerminal line_;
  std::unique_ptr<HostSession> session_;
};

TEST_F(StreamTest, ArrivesWithoutLossOrChangeWhenTheReaderKeepsUp) {
  constexpr long kQueueSize = 10000;
  // The device waits for the reader so that the queue never fills; many tokens go out at once.
  constexpr long kMostUnread = kQueueSize / 2;
  constexpr long kChunk = 200;
  const long count = TokenCount();
  Start("token_queue_size=" + std::to_string(kQueueSize));
  std::atomic<long> taken{0};
  std::atomic<bool> isOver{false};
  std::thread device([&] {
    for (long next = 0; next < count && !isOver;) {
      if (next - taken > kMostUnread - kChunk) {
        std::this_thread::yield();
        continue;
      }
      std::string bytes;
      for (const long end = std::min(count, next + kChunk); next < end; ++next) {
        bytes += Framed(next);
      }
      if (!line_.Send(bytes, Deadline::After(kStreamLimitMs))) {
        ADD_FAILURE() << "the device cannot send";
        return;
      }
    }
  });
  const auto begin = std::chrono::steady_clock::now();
  TokenReader reader(session_.get());
  ReceivedToken token;
  unsigned int waiting = 0;
  while (taken < count) {
    const bool isThere =
        events_.WaitUntil([&] { return reader.CountWaiting(&waiting) && waiting > 0; },
                          Deadline::After(kStreamLimitMs));
    const bool isTaken = isThere && reader.Take(&token) == TokenReader::Outcome::kToken;
    if (!isTaken || token.bytes != TokenText(taken)) {
      ADD_FAILURE() << "token " << taken << ": " << (isTaken ? token.bytes : "none");
      break;
    }
    ++taken;
  }
  isOver = true;
  device.join();
  const std::chrono::duration<double> took = std::chrono::steady_clock::now() - begin;
  EXPECT_EQ(taken, count);
  RecordProperty("tokens_a_second", static_cast<int>(static_cast<double>(count) / took.count()));
}

TEST_F(StreamTest, NewestTokensAreThereWhenTheReaderDoesNotKeepUp) {
  constexpr long kQueueSize = 100;
  constexpr long kSent = 5000;
  Start("token_queue_size=" + std::to_string(kQueueSize));
  std::string bytes;
  for (long number = 0; number < kSent; ++number) {
    bytes += Framed(number);
  }
  ASSERT_TRUE(line_.Send(bytes, Deadline::After(kStreamLimitMs)));
  ASSERT_TRUE(events_.WaitUntil([&] { return events_.Progress().receivedBytes == bytes.size(); },
                                Deadline::After(kStreamLimitMs)));
  TokenReader reader(session_.get());
  ReceivedToken token;
  for (long number = kSent - kQueueSize; number < kSent; ++number) {
    ASSERT_EQ(reader.Take(&token), TokenReader::Outcome::kToken) << number;
    EXPECT_EQ(token.bytes, TokenText(number));
  }
  EXPECT_EQ(reader.Take(&token), TokenReader::Outcome::kEmpty);
}

}  // namespace
