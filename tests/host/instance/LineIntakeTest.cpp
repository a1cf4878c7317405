// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <csignal>
#include <thread>

#include "host/base/Deadline.h"
#include "host/instance/LineIntake.h"

namespace {

using Kind = LineRecord::Kind;

std::vector<LineRecord> TakeNow(LineIntake* intake) { return intake->Take(Deadline::After(0)); }

TEST(LineIntake, KeepsWhatHappenedInOrder) {
  LineIntake intake;
  intake.OnServed("AB", 1000, 2000);
  intake.OnSilence(500);
  intake.OnSent("XYZ", 2);
  intake.OnLineLost("/dev/x", "gone", EIO);
  intake.OnLineBack("/dev/x");
  intake.OnPortNote("note");
  const std::vector<LineRecord> records = TakeNow(&intake);
  ASSERT_EQ(records.size(), 6U);
  EXPECT_EQ(records[0].kind, Kind::kServed);
  EXPECT_EQ(records[0].bytes, "AB");
  EXPECT_EQ(records[0].firstArrivalNs, 1000);
  EXPECT_EQ(records[0].lastArrivalNs, 2000);
  EXPECT_EQ(records[1].kind, Kind::kSilence);
  EXPECT_EQ(records[1].silenceMs, 500);
  EXPECT_EQ(records[2].bytes, "XYZ");
  EXPECT_EQ(records[2].takenBytes, 2U);
  EXPECT_EQ(records[3].errorNumber, EIO);
  EXPECT_EQ(records[3].text, "/dev/x: line lost (gone); waiting for it to come back");
  EXPECT_EQ(records[4].kind, Kind::kBack);
  EXPECT_EQ(records[5].text, "note");
  EXPECT_TRUE(TakeNow(&intake).empty());
}

TEST(LineIntake, OneSilenceIsNewsThoseBehindItAreNot) {
  LineIntake intake;
  intake.OnSilence(10);
  intake.OnSilence(10);
  EXPECT_EQ(TakeNow(&intake).size(), 1U);
  intake.OnSilence(10);
  EXPECT_TRUE(TakeNow(&intake).empty());
  intake.OnServed("A", 1, 1);
  intake.OnSilence(10);
  EXPECT_EQ(TakeNow(&intake).size(), 2U);
}

TEST(LineIntake, CountsWhatItCannotKeep) {
  LineIntake intake;
  const std::string megabyte(1024U * 1024U, 'x');
  for (int i = 0; i < 10; ++i) {
    intake.OnServed(megabyte, 1, 1);
  }
  const std::vector<LineRecord> records = TakeNow(&intake);
  ASSERT_EQ(records.size(), 9U);
  EXPECT_EQ(records.back().kind, LineRecord::Kind::kMissed);
  EXPECT_EQ(records.back().missedBytes, 2097152U);
  EXPECT_EQ(records.back().text, "2097152 bytes came too fast to be shown one by one");
  intake.OnServed(megabyte, 1, 1);
  EXPECT_EQ(TakeNow(&intake).size(), 1U);
}

TEST(LineIntake, KeepsNothingBehindWhatItCouldNotKeep) {
  LineIntake intake;
  // One byte a record, as a slow device sends them.
  for (int i = 0; i < 100010; ++i) {
    intake.OnServed("x", 1, 1);
  }
  intake.OnSilence(500);
  const std::vector<LineRecord> records = TakeNow(&intake);
  ASSERT_EQ(records.size(), 100002U);
  EXPECT_EQ(records[99999].kind, LineRecord::Kind::kServed);
  EXPECT_EQ(records[100000].kind, LineRecord::Kind::kSilence);
  EXPECT_EQ(records[100001].text, "10 bytes came too fast to be shown one by one");
}

TEST(LineIntake, FirstSignalCounts) {
  LineIntake intake;
  EXPECT_EQ(intake.StopSignal(), 0);
  intake.RequestStop(SIGTERM);
  intake.RequestStop(SIGINT);
  EXPECT_EQ(intake.StopSignal(), SIGTERM);
}

// Each of these would wait for the whole limit if nobody woke it up; a deadline of 0 returns the
// same, so the time is looked at. The limit leaves a margin of a minute.
TEST(LineIntake, WakesUpForEverythingThatMatters) {
  constexpr int kWakeLimitMs = 120000;
  constexpr int kMarginMs = 60000;
  LineIntake intake;
  const auto expectWake = [&](const std::function<void()>& cause, const char* name) {
    const Deadline deadline = Deadline::After(kWakeLimitMs);
    std::thread other(cause);
    (void)intake.Take(deadline);
    other.join();
    EXPECT_GT(deadline.RemainingMs(), kMarginMs) << name;
  };
  expectWake([&] { intake.Wake(); }, "wake");
  expectWake([&] { intake.OnPortNote("x"); }, "record");
  ReceiveProgress progress;
  progress.receivedBytes = 1;
  expectWake([&] { intake.OnReceivePause(progress); }, "first pause behind bytes");
  expectWake([&] { intake.OnReceivePause(progress); }, "second pause: a silence may end a token");
  expectWake([&] { intake.RequestStop(SIGINT); }, "stop");
}

TEST(LineIntake, QuietLineWakesNobody) {
  LineIntake intake;
  ReceiveProgress progress;
  progress.receivedBytes = 1;
  intake.OnReceivePause(progress);
  intake.OnReceivePause(progress);
  (void)TakeNow(&intake);
  intake.OnReceivePause(progress);
  const Deadline deadline = Deadline::After(20);
  (void)intake.Take(deadline);
  EXPECT_TRUE(deadline.HasPassed());
}

}  // namespace
