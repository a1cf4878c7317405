// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <algorithm>

#include "host/sim/FaultMaker.h"
#include "host/sim/Outbox.h"
#include "tests/host/sim/SimBytes.h"

namespace {

using std::chrono::milliseconds;

constexpr Outbox::Time OutboxAt(int ms) { return Outbox::Time(milliseconds(ms)); }

class OutboxTest : public testing::Test {
 protected:
  void Add(const std::string& body, int ms, const FaultOptions& options = {}) {
    const DeviceMessage message = StxEtx(body);
    ++number_;
    outbox_.Add(number_, message, FaultMaker(options, 1).Make(number_, message), OutboxAt(ms));
  }

  static FaultOptions Split() {
    FaultOptions options;
    options.pieces = 2;
    options.pauseMs = 20;
    return options;
  }

  static FaultOptions Paced() {
    FaultOptions options;
    options.baud = 10000;  // 1 ms a byte
    return options;
  }

  std::size_t room_ = 1000;
  std::uint64_t number_ = 0;
  std::string line_;
  std::vector<SentMessage> sent_;
  Outbox outbox_{[this](std::string_view bytes) {
                   const std::size_t taken = std::min(bytes.size(), room_);
                   line_ += bytes.substr(0, taken);
                   room_ -= taken;
                   return taken;
                 },
                 [this](const SentMessage& message) { sent_.push_back(message); }};
};

TEST_F(OutboxTest, SendsAMessageWhenItIsDue) {
  EXPECT_FALSE(outbox_.NextDue());
  Add("A", 10);
  EXPECT_EQ(outbox_.NextDue(), OutboxAt(10));
  outbox_.Step(OutboxAt(9));
  EXPECT_EQ(line_, "");
  outbox_.Step(OutboxAt(10));
  EXPECT_EQ(line_, "\x02\x41\x03");
  ASSERT_EQ(sent_.size(), 1U);
  EXPECT_EQ(sent_[0].number, 1U);
  EXPECT_EQ(sent_[0].wire, line_);
  EXPECT_EQ(sent_[0].begin, OutboxAt(10));
  EXPECT_EQ(sent_[0].lostBytes, 0U);
  EXPECT_TRUE(outbox_.IsEmpty());
}

TEST_F(OutboxTest, WhatIsNotTakenIsLostAndCounted) {
  room_ = 2;
  Add("ABC", 0);
  Add("D", 0);
  outbox_.Step(OutboxAt(0));
  EXPECT_EQ(line_, "\x02\x41");
  ASSERT_EQ(sent_.size(), 2U);
  EXPECT_EQ(sent_[0].wire, "\x02\x41");
  EXPECT_EQ(sent_[0].lostBytes, 3U);
  EXPECT_EQ(sent_[1].wire, "");
  EXPECT_EQ(sent_[1].lostBytes, 3U);
}

TEST_F(OutboxTest, AMessageWaitsForTheLine) {
  Add("AB", 0, Paced());
  Add("C", 1, Paced());
  outbox_.Step(OutboxAt(2));
  EXPECT_EQ(line_, "\x02\x41");
  EXPECT_EQ(outbox_.NextDue(), OutboxAt(3));
  outbox_.Step(OutboxAt(4));
  EXPECT_EQ(line_, "\x02\x41\x42\x03");
  EXPECT_EQ(outbox_.NextDue(), OutboxAt(5));
  outbox_.Step(OutboxAt(7));
  EXPECT_TRUE(outbox_.IsEmpty());
  EXPECT_EQ(sent_[1].begin, OutboxAt(4));
}

TEST_F(OutboxTest, PacedBytesCatchUpWhenTheSenderIsLate) {
  Add("ABCD", 0, Paced());
  outbox_.Step(OutboxAt(5));
  EXPECT_EQ(line_.size(), 5U);
  EXPECT_EQ(outbox_.NextDue(), OutboxAt(6));
}

TEST_F(OutboxTest, APauseIsKeptWhenTheSenderIsLate) {
  Add("ABCD", 0, Split());
  Add("E", 0);
  // The first piece goes out 100 ms late: the second one keeps its distance from it.
  outbox_.Step(OutboxAt(100));
  EXPECT_LT(line_.size(), 6U);
  EXPECT_EQ(outbox_.NextDue(), OutboxAt(120));
  outbox_.Step(OutboxAt(119));
  EXPECT_LT(line_.size(), 6U);
  // And 30 ms late again; the message behind it has no pause to keep and follows at once.
  outbox_.Step(OutboxAt(150));
  EXPECT_EQ(line_, "\x02\x41\x42\x43\x44\x03\x02\x45\x03");
  EXPECT_TRUE(outbox_.IsEmpty());
}

TEST_F(OutboxTest, AMessageWithoutBytesIsReportedToo) {
  outbox_.Add(1, {"text", {"", ""}, "", false}, {}, OutboxAt(3));
  outbox_.Step(OutboxAt(3));
  ASSERT_EQ(sent_.size(), 1U);
  EXPECT_EQ(sent_[0].wire, "");
}

}  // namespace
