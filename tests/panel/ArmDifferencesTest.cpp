// SPDX-License-Identifier: Apache-2.0
// Where a panel's 32-bit ARM processor differs from a PC: time stamps longer than a word, addresses
// that are no multiple of a word, `char` without a sign, 32 bits in `long` and in sizes. The same
// tests run on both; whoever breaks one of these notices on the PC, or in the run for the panel.
#include <gtest/gtest.h>
#include <sys/time.h>

#include <climits>
#include <ctime>
#include <vector>

#include "tests/plugin/PluginFixture.h"
#include "tests/support/HexDump.h"

namespace {

timeval systemTime = {};

}  // namespace

// The plug-in's system clock: the loader prefers the program's definition to the C library's.
extern "C" __attribute__((visibility("default"))) int gettimeofday(timeval* now,
                                                                   void* /*zone*/) noexcept {
  *now = systemTime;
  return 0;
}

namespace {

constexpr const char* kFramed = "rx_prefix=02 rx_suffix=03 tx_suffix=03";
constexpr unsigned char kFill = 0xA5;

using ArmDifferencesTest = ProtocolFixture;

std::string EveryByteBut(const std::string& left_out) {
  std::string bytes;
  for (int value = 1; value <= UCHAR_MAX; ++value) {
    const char byte = static_cast<char>(static_cast<unsigned char>(value));
    if (left_out.find(byte) == std::string::npos) bytes += byte;
  }
  return bytes;
}

TEST_F(ArmDifferencesTest, TimeStampsKeepAllTheirBits) {
  Run(kFramed);
  const ITag* tag = P().Tag("0?tokens_available?unsignedInt");
  unsigned char value[4];
  const struct {
    std::time_t seconds;
    suseconds_t microseconds;
    unsigned long long expectedMs;
  } moments[] = {
      {0, 0, 0},
      // The last moment whose milliseconds fit 32 bits, and the next one.
      {4294967, 295999, 4294967295ULL},
      {4294967, 296000, 4294967296ULL},
      {1764000000, 123456, 1764000000123ULL},
      // The last second that 32 bits with a sign hold.
      {2147483647, 999999, 2147483647999ULL},
  };
  for (const auto& moment : moments) {
    systemTime.tv_sec = moment.seconds;
    systemTime.tv_usec = moment.microseconds;
    unsigned long long stamps[3] = {7, 7, 7};
    ASSERT_NE(P()->readWithTimestamp(tag, value, &stamps[1]), 0);
    EXPECT_EQ(stamps[1], moment.expectedMs);
    ASSERT_NE(P()->readBlockWithTimestamp(tag, value, 4, &stamps[1]), 0);
    EXPECT_EQ(stamps[1], moment.expectedMs);
    EXPECT_EQ(stamps[0], 7U);
    EXPECT_EQ(stamps[2], 7U);
  }
}

// Every operation that takes or fills a buffer, at each place within a word.
TEST_F(ArmDifferencesTest, BuffersMayStandAnywhere) {
  Run(kFramed);
  for (std::size_t place = 0; place < 8; ++place) {
    alignas(8) unsigned char memory[64];
    unsigned char* const buffer = memory + place;
    const ITag* baud = P().Tag("0?SP_Baud?unsignedInt(swap4)");
    const ITag* token = P().Tag("0?rx_token?string-9");
    const unsigned char written[4] = {0, 0, 0x4B, 0};  // 19200 with its bytes turned round
    std::copy(written, written + 4, buffer);
    ASSERT_NE(P()->Write(baud, buffer), 0) << P().Error();
    EXPECT_EQ(P().ReadNumber("SP_Baud"), 19200U);
    std::fill(memory, memory + sizeof(memory), kFill);
    ASSERT_NE(P()->Read(baud, buffer), 0);
    EXPECT_EQ(std::string(buffer, buffer + 5), std::string("\0\0\x4B\0\xA5", 5)) << place;
    ASSERT_NE(P()->ReadBlock(baud, buffer, 4), 0);
    EXPECT_EQ(std::string(buffer, buffer + 5), std::string("\0\x4B\0\0\xA5", 5)) << place;
    ASSERT_TRUE(baud->Convert(buffer, buffer + 8, false));
    EXPECT_EQ(std::string(buffer + 8, buffer + 12), std::string("\0\0\x4B\0", 4)) << place;
    Receive("\x02TOKEN\x03");
    ASSERT_NE(P()->Read(token, buffer), 0);
    EXPECT_STREQ(reinterpret_cast<const char*>(buffer), "TOKEN") << place;
    EXPECT_EQ(P().TakeTokens(), "[TOKEN]");
    EXPECT_EQ(P()->GetInfo(reinterpret_cast<char*>(buffer), 16), 16);
    EXPECT_EQ(P()->vcsGetComParams(reinterpret_cast<char*>(buffer), 16), 1);
    EXPECT_FALSE(P()->DoCommand("no such command", reinterpret_cast<char*>(buffer), 16));
  }
}

TEST_F(ArmDifferencesTest, BytesAbove127AreBytes) {
  Run(kFramed);
  const std::string bytes = EveryByteBut("\x02\x03");
  Receive("\x02" + bytes + "\x03");
  EXPECT_EQ(P().TakeTokens(), "[" + bytes + "]");
  Calls();
  ASSERT_TRUE(P().WriteText("tx_token", bytes, 300)) << P().Error();
  EXPECT_NE(Calls().find("Send " + HexDump(bytes + "\x03")), std::string::npos);
}

TEST_F(ArmDifferencesTest, HexTextOfBytesAbove127) {
  Run("rx_prefix=FF80 rx_suffix=FE hex_tokens=true tx_prefix=81 tx_suffix=none");
  Receive("\xFF\x80\x7F\x80\xFF\xFE");
  EXPECT_EQ(P().TakeTokens(), "[7F80FF]");
  Calls();
  ASSERT_TRUE(P().WriteText("tx_token", "80ff7F"));
  EXPECT_NE(Calls().find("Send 81 80 FF 7F"), std::string::npos);
  EXPECT_FALSE(P().WriteText("SP_RxPrefix", "\xB0\xB1"));
}

TEST_F(ArmDifferencesTest, ValuesAbove127AreNoNegativeOnes) {
  Run(kFramed);
  EXPECT_TRUE(P().WriteFlag("SP_HexTokens", 0x80));
  EXPECT_TRUE(P().ReadFlag("SP_HexTokens"));
  for (const unsigned code : {0x80U, 0xFFU}) {
    EXPECT_FALSE(P().WriteByte("SP_Par", code));
    EXPECT_FALSE(P().WriteByte("SP_Bits", code));
    EXPECT_FALSE(P().WriteByte("SP_Stop", code));
    EXPECT_FALSE(P().WriteByte("SP_Mode", code));
  }
  const ITag* nibbles = P().Tag("0?SP_Bits?unsignedByte(swapnibble)");
  const ITag* digits = P().Tag("0?SP_Bits?unsignedByte(bcd)");
  unsigned char from[1] = {0x8F};
  unsigned char to[1] = {0};
  ASSERT_TRUE(nibbles->Convert(from, to, true));
  EXPECT_EQ(to[0], 0xF8);
  from[0] = 0x99;
  ASSERT_TRUE(digits->Convert(from, to, false));
  EXPECT_EQ(to[0], 99);
  from[0] = 0x80;
  ASSERT_TRUE(digits->Convert(from, to, false));
  EXPECT_EQ(to[0], 80);
}

TEST_F(ArmDifferencesTest, NumbersBeyond32BitsSaturate) {
  // 2^32 + 100 would be 100 where `long` has 64 bits and the upper ones are dropped.
  Run("rx_suffix=03 gap=4294967396");
  EXPECT_EQ(P().ReadNumber("SP_Gap"), 2147483647U);
  host_.RunUntilSilent();
  EXPECT_NE(Calls().find("2147483647"), std::string::npos);
  EXPECT_EQ(P()->GetNodeID(P().Tag("4294967297?connect?boolean")), INT_MAX);
  EXPECT_EQ(P()->GetNodeID(P().Tag("2147483648?connect?boolean")), INT_MAX);
  EXPECT_EQ(P().Tag("0?rx_token?string-4294967297")->GetVarLength(), INT_MAX);
}

TEST_F(ArmDifferencesTest, SizesBeyondTheAddressesAreRefused) {
  Run(kFramed);
  if (sizeof(void*) > sizeof(int)) GTEST_SKIP() << "there are addresses enough here";
  // Whole items of four bytes for this many bytes are more than an address can count.
  const ITag* tag = P().Tag("0?SP_Baud?unsignedInt");
  std::vector<unsigned char> buffer(16, kFill);
  for (const int lengthBytes : {INT_MAX, INT_MAX - 2}) {
    EXPECT_EQ(P()->ReadBlock(tag, buffer.data(), lengthBytes), 0);
    EXPECT_EQ(P()->GetLastError(), -1);
  }
  EXPECT_EQ(buffer, std::vector<unsigned char>(16, kFill));
}

}  // namespace
