// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "host/port/EchoFilter.h"

namespace {

using Outcome = EchoFilter::Outcome;

class EchoFilterTest : public testing::Test {
 protected:
  // What is left of the received bytes.
  std::string Filtered(std::string bytes, std::int64_t nowNs = 0) {
    outcome_ = filter_.Filter(&bytes, nowNs, &removed_);
    return bytes;
  }

  EchoFilter filter_;
  Outcome outcome_ = Outcome::kAsExpected;
  std::size_t removed_ = 0;
};

TEST_F(EchoFilterTest, LeavesEverythingAloneWithoutASend) {
  EXPECT_EQ(Filtered("abc"), "abc");
  EXPECT_EQ(outcome_, Outcome::kAsExpected);
  EXPECT_EQ(removed_, 0U);
}

TEST_F(EchoFilterTest, TakesExactlyTheBytesSentHoweverTheyAreCut) {
  filter_.Expect("hello", 0, 0);
  EXPECT_EQ(Filtered("he"), "");
  EXPECT_EQ(removed_, 2U);
  EXPECT_EQ(Filtered("llohello"), "hello");
  EXPECT_EQ(removed_, 3U);
  EXPECT_EQ(outcome_, Outcome::kAsExpected);
  EXPECT_EQ(Filtered("hello"), "hello");
}

TEST_F(EchoFilterTest, SendsAddUp) {
  filter_.Expect("ab", 0, 0);
  filter_.Expect("cd", 0, 0);
  EXPECT_EQ(Filtered("abcdx"), "x");
}

TEST_F(EchoFilterTest, SomethingElseIsACollisionAndFromThereOnData) {
  filter_.Expect("abc", 0, 0);
  EXPECT_EQ(Filtered("aXc"), "Xc");
  EXPECT_EQ(outcome_, Outcome::kMismatch);
  EXPECT_EQ(removed_, 1U);
  EXPECT_EQ(Filtered("bc"), "bc");
  EXPECT_EQ(outcome_, Outcome::kAsExpected);
}

TEST_F(EchoFilterTest, WaitsForAsLongAsTheLineNeedsAndABit) {
  constexpr std::int64_t kLineNs = 1'000'000'000;
  filter_.Expect("ab", 0, kLineNs);
  EXPECT_EQ(Filtered("a", kLineNs + EchoFilter::kGraceNs), "");
  EXPECT_EQ(Filtered("b", kLineNs + EchoFilter::kGraceNs + 1), "b");
  EXPECT_EQ(outcome_, Outcome::kNoEcho);
  EXPECT_EQ(Filtered("ab", kLineNs + EchoFilter::kGraceNs + 2), "ab");
  EXPECT_EQ(outcome_, Outcome::kAsExpected);
}

TEST_F(EchoFilterTest, WhatTheLineDidNotTakeIsNotWaitedFor) {
  filter_.Expect("abcd", 0, 0);
  filter_.Withdraw(2);
  EXPECT_EQ(Filtered("abcd"), "cd");
  filter_.Expect("ab", 0, 0);
  filter_.Withdraw(5);
  EXPECT_EQ(Filtered("ab"), "ab");
  filter_.Expect("ab", 0, 0);
  filter_.Clear();
  EXPECT_EQ(Filtered("ab"), "ab");
}

}  // namespace
