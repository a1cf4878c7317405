// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <cerrno>
#include <csignal>
#include <thread>
#include <vector>

#include "host/base/Deadline.h"
#include "host/runtime/HostEvents.h"
#include "tests/host/support/TestLimit.h"

namespace {

TEST(HostEvents, ConditionThatHoldsNeedsNoEvent) {
  HostEvents events(nullptr);
  EXPECT_TRUE(events.WaitUntil([] { return true; }, Deadline::After(0)));
}

TEST(HostEvents, PassedDeadlineEndsAWait) {
  HostEvents events(nullptr);
  EXPECT_FALSE(events.WaitUntil([] { return false; }, Deadline::After(0)));
}

TEST(HostEvents, WaitSeesProgress) {
  HostEvents events(nullptr);
  std::thread receiver([&] { events.OnReceivePause({7, 1}); });
  EXPECT_TRUE(events.WaitUntil([&] { return events.Progress().receivedBytes == 7; },
                               Deadline::After(kLimitMs)));
  receiver.join();
}

TEST(HostEvents, StopEndsAWaitAndTheFirstSignalCounts) {
  HostEvents events(nullptr);
  std::thread signaller([&] {
    events.RequestStop(SIGTERM);
    events.RequestStop(SIGINT);
  });
  EXPECT_FALSE(events.WaitUntil([] { return false; }, Deadline::After(kLimitMs)));
  signaller.join();
  EXPECT_EQ(events.StopSignal(), SIGTERM);
  EXPECT_FALSE(events.WaitUntil([] { return true; }, Deadline::After(kLimitMs)));
}

TEST(HostEvents, WaitsForSilences) {
  HostEvents events(nullptr);
  events.OnReceivePause({0, 5});
  EXPECT_FALSE(events.WaitForSilences(1, Deadline::After(0)));
  std::atomic<bool> isDone{false};
  std::thread receiver([&] {
    for (std::uint64_t silences = 6; !isDone; ++silences) {
      events.OnReceivePause({0, silences});
      std::this_thread::yield();
    }
  });
  EXPECT_TRUE(events.WaitForSilences(2, Deadline::After(kLimitMs)));
  isDone = true;
  receiver.join();
}

TEST(HostEvents, PassesNotesOn) {
  std::vector<std::string> notes;
  HostEvents events([&](const std::string& text) { notes.push_back(text); });
  events.OnLineLost("/dev/x", "gone", EIO);
  events.OnLineGone("/dev/x", "gone", 0);
  events.OnLineBack("/dev/x");
  events.OnPortNote("note");
  ASSERT_EQ(notes.size(), 4U);
  EXPECT_EQ(notes[0], "/dev/x: line lost (gone, EIO); waiting for it to come back");
  EXPECT_EQ(notes[1], "/dev/x: line lost (gone); not opened again (reconnect=off)");
  EXPECT_EQ(notes[2], "/dev/x: line is back, opened again with the same settings");
  EXPECT_EQ(notes[3], "note");
}

}  // namespace
