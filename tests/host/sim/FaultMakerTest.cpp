// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <algorithm>
#include <bit>

#include "host/sim/FaultMaker.h"
#include "tests/host/sim/SimBytes.h"

namespace {

using Names = std::vector<std::string>;
using std::chrono::microseconds;
using std::chrono::milliseconds;

constexpr std::uint64_t kSeed = 7;

TEST(FaultMaker, WithoutFaultsTheFramedMessageGoesOutAtOnce) {
  const WireMessage wire = FaultMaker({}, kSeed).Make(1, StxEtx("AB"));
  ASSERT_EQ(wire.chunks.size(), 1U);
  EXPECT_EQ(wire.chunks[0].bytes, "\x02\x41\x42\x03");
  EXPECT_EQ(wire.chunks[0].offset.count(), 0);
  EXPECT_EQ(wire.length.count(), 0);
  EXPECT_EQ(wire.faults, Names());
}

TEST(FaultMaker, DropsPrefixAndSuffix) {
  FaultOptions options;
  options.dropPrefixPercent = 100;
  WireMessage wire = FaultMaker(options, kSeed).Make(1, StxEtx("AB"));
  EXPECT_EQ(Bytes(wire), "AB\x03");
  EXPECT_EQ(wire.faults, Names{"drop-prefix"});
  options.dropSuffixPercent = 100;
  wire = FaultMaker(options, kSeed).Make(1, StxEtx("AB"));
  EXPECT_EQ(Bytes(wire), "AB");
  EXPECT_EQ(wire.faults, (Names{"drop-prefix", "drop-suffix"}));
}

TEST(FaultMaker, WhatIsNotThereIsNotDropped) {
  FaultOptions options;
  options.dropPrefixPercent = 100;
  options.dropSuffixPercent = 100;
  const WireMessage wire = FaultMaker(options, kSeed).Make(1, {"text", {"", ""}, "AB", false});
  EXPECT_EQ(Bytes(wire), "AB");
  EXPECT_EQ(wire.faults, Names());
}

TEST(FaultMaker, TooLongBodiesHaveTheLengthAskedFor) {
  FaultOptions options;
  options.tooLongBytes = 1100;
  const std::string bytes = Bytes(FaultMaker(options, kSeed).Make(1, StxEtx("AB")));
  EXPECT_EQ(bytes.size(), 1102U);
  EXPECT_EQ(bytes.substr(0, 5), "\x02\x41\x42\x41\x42");
  EXPECT_EQ(bytes.back(), '\x03');
  EXPECT_EQ(Bytes(FaultMaker(options, kSeed).Make(1, StxEtx(""))).size(), 1102U);
}

TEST(FaultMaker, NoiseOnlyAddsBytes) {
  FaultOptions options;
  options.noisePercent = 100;
  const WireMessage wire = FaultMaker(options, kSeed).Make(1, StxEtx("AB"));
  const std::string bytes = Bytes(wire);
  ASSERT_EQ(bytes.size(), 8U);
  EXPECT_EQ(std::string({bytes[1], bytes[3], bytes[5], bytes[7]}), "\x02\x41\x42\x03");
  EXPECT_EQ(wire.faults, Names{"noise"});
}

TEST(FaultMaker, FlipChangesExactlyOneBitOfAByte) {
  FaultOptions options;
  options.flipPercent = 100;
  const WireMessage wire = FaultMaker(options, kSeed).Make(1, StxEtx("AB"));
  const std::string bytes = Bytes(wire);
  const std::string meant = "\x02\x41\x42\x03";
  ASSERT_EQ(bytes.size(), meant.size());
  for (std::size_t i = 0; i < meant.size(); ++i) {
    const auto difference = static_cast<unsigned char>(bytes[i] ^ meant[i]);
    EXPECT_EQ(std::popcount(difference), 1) << i;
  }
  EXPECT_EQ(wire.faults, Names{"flip"});
}

TEST(FaultMaker, SplitKeepsTheBytesAndPutsPausesBetweenThePieces) {
  FaultOptions options;
  options.pieces = 3;
  options.pauseMs = 20;
  const WireMessage wire = FaultMaker(options, kSeed).Make(1, StxEtx("ABCDEF"));
  ASSERT_EQ(wire.chunks.size(), 3U);
  EXPECT_EQ(Bytes(wire), StxEtx("ABCDEF").framing.prefix + "ABCDEF\x03");
  for (std::size_t i = 0; i < 3; ++i) {
    EXPECT_FALSE(wire.chunks[i].bytes.empty());
    EXPECT_EQ(wire.chunks[i].offset, milliseconds(20) * i);
    EXPECT_EQ(wire.chunks[i].isBehindPause, i > 0);
  }
  EXPECT_EQ(wire.length, milliseconds(40));
  EXPECT_EQ(wire.faults, Names{"split"});
}

TEST(FaultMaker, AMessageHasAtMostAsManyPiecesAsBytes) {
  FaultOptions options;
  options.pieces = 10;
  options.pauseMs = 1;
  const FaultMaker maker(options, kSeed);
  EXPECT_EQ(maker.Make(1, {"text", {"", ""}, "ABC", false}).chunks.size(), 3U);
  const WireMessage one = maker.Make(1, {"text", {"", ""}, "A", false});
  EXPECT_EQ(one.chunks.size(), 1U);
  EXPECT_EQ(one.faults, Names());
  EXPECT_EQ(Bytes(maker.Make(1, {"text", {"", ""}, "", false})), "");
}

TEST(FaultMaker, PacesBytesLikeALine) {
  FaultOptions options;
  options.baud = 10000;  // a byte of ten bits takes 1 ms
  const WireMessage wire = FaultMaker(options, kSeed).Make(1, StxEtx("AB"));
  ASSERT_EQ(wire.chunks.size(), 4U);
  for (std::size_t i = 0; i < 4; ++i) {
    EXPECT_EQ(wire.chunks[i].offset, milliseconds(1) * (i + 1));
    EXPECT_FALSE(wire.chunks[i].isBehindPause);
  }
  EXPECT_EQ(wire.length, milliseconds(4));
}

TEST(FaultMaker, PacedPiecesHaveTheirPauseBetweenTheBytes) {
  FaultOptions options;
  options.baud = 10000;
  options.pieces = 2;
  options.pauseMs = 50;
  const WireMessage wire = FaultMaker(options, kSeed).Make(1, StxEtx("AB"));
  ASSERT_EQ(wire.chunks.size(), 4U);
  EXPECT_EQ(wire.length, milliseconds(54));
  const auto pauses = std::count_if(wire.chunks.begin(), wire.chunks.end(),
                                    [](const TimedChunk& chunk) { return chunk.isBehindPause; });
  EXPECT_EQ(pauses, 1);
}

TEST(FaultMaker, EchoesArePacedAndOtherwiseLeftAlone) {
  FaultOptions options;
  options.noisePercent = 100;
  options.flipPercent = 100;
  options.tooLongBytes = 2000;
  options.pieces = 2;
  options.baud = 10000;
  const WireMessage wire = FaultMaker(options, kSeed).Make(1, {"echo", {"", ""}, "AT\r", true});
  EXPECT_EQ(Bytes(wire), "AT\r");
  EXPECT_EQ(wire.faults, Names());
  EXPECT_EQ(wire.length, milliseconds(3));
}

FaultOptions ManyFaults() {
  FaultOptions options;
  options.dropPrefixPercent = 20;
  options.dropSuffixPercent = 20;
  options.noisePercent = 5;
  options.flipPercent = 5;
  options.pieces = 2;
  options.tooLongBytes = 1100;
  options.tooLongPercent = 10;
  return options;
}

std::string ManyMessages(const FaultOptions& options, std::uint64_t seed) {
  std::string all;
  for (std::uint64_t number = 1; number <= 50; ++number) {
    const WireMessage wire = FaultMaker(options, seed).Make(number, StxEtx("ABCDEFGH"));
    for (const TimedChunk& chunk : wire.chunks) {
      all += chunk.bytes + "|";
    }
  }
  return all;
}

TEST(FaultMaker, TheSeedRepeatsTheRun) {
  EXPECT_EQ(ManyMessages(ManyFaults(), 1), ManyMessages(ManyFaults(), 1));
  EXPECT_NE(ManyMessages(ManyFaults(), 1), ManyMessages(ManyFaults(), 2));
}

int CountFault(const FaultOptions& options, const std::string& name) {
  int count = 0;
  for (std::uint64_t number = 1; number <= 2000; ++number) {
    const Names faults = FaultMaker(options, kSeed).Make(number, StxEtx("ABCDEFGH")).faults;
    count += static_cast<int>(std::count(faults.begin(), faults.end(), name));
  }
  return count;
}

TEST(FaultMaker, ChancesHoldOverManyMessages) {
  // Expected 400 and 200 of 2000; six standard deviations are 107 and 80.
  EXPECT_NEAR(CountFault(ManyFaults(), "drop-prefix"), 400, 107);
  EXPECT_NEAR(CountFault(ManyFaults(), "drop-suffix"), 400, 107);
  EXPECT_NEAR(CountFault(ManyFaults(), "too-long"), 200, 80);
  EXPECT_EQ(CountFault({}, "drop-suffix"), 0);
}

TEST(FaultMaker, OneFaultDoesNotMoveAnother) {
  FaultOptions only;
  only.dropSuffixPercent = 20;
  for (std::uint64_t number = 1; number <= 200; ++number) {
    const Names one = FaultMaker(only, kSeed).Make(number, StxEtx("AB")).faults;
    const Names many = FaultMaker(ManyFaults(), kSeed).Make(number, StxEtx("AB")).faults;
    EXPECT_EQ(!one.empty(), std::count(many.begin(), many.end(), "drop-suffix") == 1) << number;
  }
}

}  // namespace
