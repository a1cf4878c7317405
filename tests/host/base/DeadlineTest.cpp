// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>
#include <poll.h>
#include <sys/time.h>
#include <unistd.h>

#include <chrono>
#include <csignal>

#include "host/base/Deadline.h"
#include "host/runtime/PosixMultiTask.h"

// Margins: a wait may end late by any time on a busy machine, so only "not early" is asserted.

namespace {

using Clock = std::chrono::steady_clock;
using std::chrono::milliseconds;

constexpr int kWaitMs = 40;
constexpr int kFarMs = 3600 * 1000;

// Interrupts the thread's waits every 3 ms while it lives.
class Interrupter {
 public:
  Interrupter() {
    count = 0;
    struct sigaction action {};
    action.sa_handler = [](int) { count = count + 1; };
    sigaction(SIGALRM, &action, &formerAction_);
    const itimerval interval = {{0, 3000}, {0, 3000}};
    setitimer(ITIMER_REAL, &interval, nullptr);
  }
  ~Interrupter() {
    const itimerval none = {};
    setitimer(ITIMER_REAL, &none, nullptr);
    sigaction(SIGALRM, &formerAction_, nullptr);
  }
  Interrupter(const Interrupter&) = delete;
  Interrupter& operator=(const Interrupter&) = delete;

  // Whether signals come at all. The thread sanitizer holds them back until a call like poll(2).
  static bool IsFelt() {
    for (int attempt = 0; attempt < 1000 && count == 0; ++attempt) {
      (void)poll(nullptr, 0, 1);
    }
    return count > 0;
  }

  static volatile sig_atomic_t count;

 private:
  struct sigaction formerAction_ {};
};
volatile sig_atomic_t Interrupter::count = 0;

TEST(Deadline, PassesAfterItsTime) {
  const Deadline now = Deadline::After(0);
  EXPECT_TRUE(now.HasPassed());
  EXPECT_EQ(now.RemainingMs(), 0);
  EXPECT_EQ(now.Remaining().count(), 0);
  const Deadline far = Deadline::After(kFarMs);
  EXPECT_FALSE(far.HasPassed());
  EXPECT_GT(far.RemainingMs(), kFarMs / 2);
  EXPECT_LE(far.RemainingMs(), kFarMs);
}

TEST(Deadline, NegativeTimeCountsAsNone) {
  EXPECT_TRUE(Deadline::After(-1).HasPassed());
  EXPECT_TRUE(Deadline::After(-2147483647 - 1).HasPassed());
}

TEST(Deadline, LongestTimeDoesNotOverflow) {
  EXPECT_FALSE(Deadline::After(2147483647).HasPassed());
  EXPECT_GT(Deadline::After(2147483647).RemainingMs(), 2147000000);
}

TEST(Deadline, RoundsWhatIsLeftUp) {
  const Deadline deadline = Deadline::After(1000);
  const auto leftBefore = deadline.Remaining();
  const int leftMs = deadline.RemainingMs();
  EXPECT_LE(milliseconds(leftMs), leftBefore + milliseconds(1));
  EXPECT_GE(milliseconds(leftMs), deadline.Remaining());
}

TEST(Deadline, TakesTheEarlierOfTwo) {
  const Deadline near = Deadline::After(0);
  const Deadline far = Deadline::After(kFarMs);
  EXPECT_TRUE(Deadline::Earlier(near, far).HasPassed());
  EXPECT_TRUE(Deadline::Earlier(far, near).HasPassed());
  EXPECT_FALSE(Deadline::Earlier(far, far).HasPassed());
}

TEST(Deadline, SleepsToTheEndInSpiteOfSignals) {
  const auto begin = Clock::now();
  {
    const Interrupter interrupter;
    Deadline::After(kWaitMs).Sleep();
    EXPECT_GE(Clock::now() - begin, milliseconds(kWaitMs));
    EXPECT_TRUE(Interrupter::IsFelt());
  }
}

TEST(Deadline, PollsToTheEndInSpiteOfSignals) {
  int ends[2];
  ASSERT_EQ(pipe(ends), 0);
  const auto begin = Clock::now();
  {
    const Interrupter interrupter;
    pollfd wait = {ends[0], POLLIN, 0};
    EXPECT_EQ(Deadline::After(kWaitMs).Poll(&wait, 1), 0);
    EXPECT_GE(Clock::now() - begin, milliseconds(kWaitMs));
    EXPECT_TRUE(Interrupter::IsFelt());
  }
  close(ends[0]);
  close(ends[1]);
}

TEST(Deadline, PollSeesWhatIsReadyEvenWhenItHasPassed) {
  int ends[2];
  ASSERT_EQ(pipe(ends), 0);
  ASSERT_EQ(write(ends[1], "x", 1), 1);
  pollfd wait = {ends[0], POLLIN, 0};
  EXPECT_EQ(Deadline::After(0).Poll(&wait, 1), 1);
  EXPECT_EQ(Deadline::After(kFarMs).Poll(&wait, 1), 1);
  close(ends[0]);
  close(ends[1]);
}

TEST(PosixMultiTaskSleep, SleepsTheWholeTimeInSpiteOfSignals) {
  PosixMultiTask multiTask;
  const auto begin = Clock::now();
  {
    const Interrupter interrupter;
    multiTask.Sleep(kWaitMs);
    EXPECT_GE(Clock::now() - begin, milliseconds(kWaitMs));
  }
}

}  // namespace
