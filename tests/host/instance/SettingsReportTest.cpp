// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "host/instance/SettingsReport.h"

namespace {

using Lines = std::vector<std::string>;
using std::string_literals::operator""s;

constexpr const char* kConfiguration =
    "CfgVer=1 model=1 port=com1 baudrate=0x2580 parity=even bits=8 stopbits=1 mode=RS-232 "
    "rx_prefix=0d0A";

Lines OverridesOf(const std::string& key, StoredValue value) {
  return DescribeOverrides(kConfiguration, {{{"ident", key}, std::move(value)}});
}

TEST(SettingsReport, IsSilentWhereStorageAndConfigurationAgree) {
  EXPECT_EQ(OverridesOf("baud", 9600), Lines{});
  EXPECT_EQ(OverridesOf("parity", 1), Lines{});
  EXPECT_EQ(OverridesOf("mode", 0), Lines{});
  EXPECT_EQ(OverridesOf("rx_prefix", "0D0A"s), Lines{});
  EXPECT_EQ(OverridesOf("rx_suffix", ""s), Lines{});
  EXPECT_EQ(OverridesOf("tx_suffix", "none"s), Lines{});
  EXPECT_EQ(OverridesOf("gap", 0), Lines{});
  EXPECT_EQ(OverridesOf("hex_tokens", false), Lines{});
  EXPECT_EQ(OverridesOf("token_queue_size", 100), Lines{});
  EXPECT_EQ(OverridesOf("something_else", 1), Lines{});
}

TEST(SettingsReport, NamesEachOverride) {
  EXPECT_EQ(OverridesOf("baud", 115200), Lines{"stored override: baud 115200 instead of 9600"});
  EXPECT_EQ(OverridesOf("parity", 4), Lines{"stored override: parity space instead of even"});
  EXPECT_EQ(OverridesOf("parity", 9), Lines{"stored override: parity 9 instead of even"});
  EXPECT_EQ(OverridesOf("bits", 7), Lines{"stored override: bits 7 instead of 8"});
  EXPECT_EQ(OverridesOf("stop", 2), Lines{"stored override: stop 2 instead of 1"});
  EXPECT_EQ(OverridesOf("mode", 1), Lines{"stored override: mode RS-485 instead of RS-232"});
  EXPECT_EQ(OverridesOf("rx_prefix", "none"s),
            Lines{"stored override: rx_prefix none instead of 0D0A"});
  EXPECT_EQ(OverridesOf("tx_prefix", "02"s),
            Lines{"stored override: tx_prefix 02 instead of none"});
  EXPECT_EQ(OverridesOf("gap", 20), Lines{"stored override: gap 20 instead of 0"});
  EXPECT_EQ(OverridesOf("hex_tokens", true),
            Lines{"stored override: hex_tokens true instead of false"});
  EXPECT_EQ(OverridesOf("token_queue_size", 5),
            Lines{"stored override: token_queue_size 5 instead of 100"});
}

TEST(SettingsReport, ListsSeveralInAFixedOrder) {
  EXPECT_EQ(
      DescribeOverrides(kConfiguration, {{{"i", "gap"}, 1}, {{"i", "baud"}, 300}}),
      (Lines{"stored override: baud 300 instead of 9600", "stored override: gap 1 instead of 0"}));
}

}  // namespace
