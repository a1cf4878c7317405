// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <deque>
#include <string>

#include "host/port/ArrivalClock.h"

namespace {

constexpr std::int64_t kMs = 1'000'000;
constexpr std::int64_t kT = 10 * kMs;

// A receiver on a clock that moves on command. Bytes stand in the line with their arrival times;
// the receiver asks when the test says so, which stands for a driver that is late or away.
class Receiver {
 public:
  void Arrives(char byte, std::int64_t atMs) { line_.push_back({byte, atMs * kMs}); }

  // Asks once at atMs, or when the call before has ended if that is later. The byte, or '.' for a
  // time-out.
  char Ask(std::int64_t atMs) {
    nowNs_ = std::max(nowNs_, atMs * kMs);
    if (!line_.empty() && line_.front().arrivedNs <= nowNs_) {
      return Answer(nowNs_);
    }
    const std::int64_t deadlineNs = clock_.DeadlineNs(nowNs_, kT);
    nowNs_ = std::max(nowNs_, deadlineNs);
    if (!line_.empty() && line_.front().arrivedNs <= nowNs_) {
      nowNs_ = line_.front().arrivedNs;
      return Answer(deadlineNs);
    }
    clock_.TimedOut(deadlineNs);
    return '.';
  }

  // Asks until the line is empty and a time-out has ended it.
  std::string AskAll(std::int64_t fromMs) {
    std::string answers;
    do {
      answers += Ask(fromMs);
    } while (!line_.empty() || answers.back() != '.');
    return answers;
  }

  std::int64_t NowMs() const { return nowNs_ / kMs; }

 private:
  struct Arrival {
    char byte;
    std::int64_t arrivedNs;
  };

  char Answer(std::int64_t endNs) {
    const Arrival next = line_.front();
    if (!clock_.IsInTime(next.arrivedNs, kT)) {
      clock_.TimedOut(endNs);
      return '.';
    }
    line_.pop_front();
    clock_.Gave(next.arrivedNs);
    return next.byte;
  }

  ArrivalClock clock_;
  std::deque<Arrival> line_;
  std::int64_t nowNs_ = 0;
};

TEST(ArrivalClock, WaitsItsTimeOutWhenNothingComes) {
  Receiver receiver;
  EXPECT_EQ(receiver.Ask(5), '.');
  EXPECT_EQ(receiver.NowMs(), 15);
  // The next one counts from the end of the one before, however late it is asked for.
  EXPECT_EQ(receiver.Ask(18), '.');
  EXPECT_EQ(receiver.NowMs(), 25);
}

TEST(ArrivalClock, BytesOfOneTokenStayTogetherWhenTheReceiverIsLate) {
  Receiver receiver;
  receiver.Arrives('a', 0);
  receiver.Arrives('b', 9);
  receiver.Arrives('c', 19);
  EXPECT_EQ(receiver.AskAll(500), "abc.");
  EXPECT_EQ(receiver.NowMs(), 500);
}

TEST(ArrivalClock, ExactlyTheTimeOutIsInTime) {
  Receiver receiver;
  receiver.Arrives('a', 0);
  receiver.Arrives('b', 10);
  EXPECT_EQ(receiver.AskAll(0), "ab.");
  Receiver other;
  other.Arrives('a', 0);
  other.Arrives('b', 11);
  EXPECT_EQ(other.AskAll(0), "a.b.");
}

TEST(ArrivalClock, SilencesStillSeparateWhenTheReceiverIsLate) {
  Receiver receiver;
  for (int token = 0; token < 4; ++token) {
    receiver.Arrives('a', token * 30);
    receiver.Arrives('b', token * 30 + 1);
  }
  EXPECT_EQ(receiver.AskAll(1000), "ab.ab.ab.ab.");
  EXPECT_EQ(receiver.NowMs(), 1000);
}

TEST(ArrivalClock, WorkBetweenTwoCallsTakesNothingFromTheSilence) {
  Receiver receiver;
  receiver.Arrives('a', 0);
  EXPECT_EQ(receiver.Ask(0), 'a');
  // Asked 8 ms after the byte, the time-out is over 10 ms after the byte, not after the call.
  EXPECT_EQ(receiver.Ask(8), '.');
  EXPECT_EQ(receiver.NowMs(), 10);
}

TEST(ArrivalClock, LongAbsenceCostsOneTimeOutNotMany) {
  Receiver receiver;
  receiver.Arrives('a', 0);
  EXPECT_EQ(receiver.Ask(0), 'a');
  receiver.Arrives('b', 60'000);
  receiver.Arrives('c', 60'001);
  // The silence of a minute ends the first token with one answer, at once.
  EXPECT_EQ(receiver.Ask(90'000), '.');
  EXPECT_EQ(receiver.Ask(90'000), 'b');
  EXPECT_EQ(receiver.Ask(90'000), 'c');
  // The silence behind it has lasted for half a minute: one answer at once, then time passes again.
  EXPECT_EQ(receiver.Ask(90'000), '.');
  EXPECT_EQ(receiver.NowMs(), 90'000);
  EXPECT_EQ(receiver.Ask(90'000), '.');
  EXPECT_EQ(receiver.NowMs(), 90'010);
}

TEST(ArrivalClock, ByteBehindATimeOutIsNotHeldBackByAnother) {
  Receiver receiver;
  EXPECT_EQ(receiver.Ask(0), '.');
  receiver.Arrives('a', 5000);
  EXPECT_EQ(receiver.Ask(6000), 'a');
}

TEST(ArrivalClock, AnIdleReceiverNeverSpins) {
  Receiver receiver;
  receiver.Arrives('a', 0);
  EXPECT_EQ(receiver.Ask(0), 'a');
  EXPECT_EQ(receiver.Ask(30'000), '.');
  constexpr int kCalls = 100;
  for (int call = 0; call < kCalls; ++call) {
    EXPECT_EQ(receiver.Ask(0), '.');
  }
  EXPECT_EQ(receiver.NowMs(), 30'000 + kCalls * 10);
}

TEST(ArrivalClock, AByteFoundByTheReceiverItselfIsInTimeUpToHalfTheTimeOut) {
  // Found on the dot, and before: the moment itself.
  EXPECT_EQ(ArrivalClock::BelatedArrivalNs(100, 100, kT), 100);
  EXPECT_EQ(ArrivalClock::BelatedArrivalNs(90, 100, kT), 90);
  EXPECT_EQ(ArrivalClock::BelatedArrivalNs(100 + kT / 2, 100, kT), 100);
  EXPECT_EQ(ArrivalClock::BelatedArrivalNs(101 + kT / 2, 100, kT), 101 + kT / 2);
}

}  // namespace
