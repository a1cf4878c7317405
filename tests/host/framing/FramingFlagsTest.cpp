// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <CLI/CLI.hpp>
#include <memory>

#include "host/framing/ConfigKeyTable.h"
#include "host/framing/FramingFlags.h"
#include "host/runtime/HostSession.h"
#include "tests/support/PluginLibrary.h"

namespace {

// The flags of one command line.
class Parsed {
 public:
  explicit Parsed(const std::string& line) {
    flags_.AddAll(&app_);
    flags_.AddConfiguring(&app_);
    app_.parse(line);
  }
  const FramingFlags& operator*() const { return flags_; }
  const FramingFlags* operator->() const { return &flags_; }

 private:
  CLI::App app_;
  FramingFlags flags_;
};

constexpr const char* kDefaults =
    "CfgVer=1 model=1 port=com1 baudrate=9600 parity=even bits=8 stopbits=1 mode=RS-232";

TEST(FramingFlags, DefaultsAreTheMandatoryKeys) {
  EXPECT_EQ(Parsed("")->Configuration(), kDefaults);
  EXPECT_FALSE(Parsed("")->IsGiven());
  EXPECT_EQ(Parsed("")->Apply("CfgVer=1 gap=7"), "CfgVer=1 gap=7");
}

TEST(FramingFlags, EveryFlag) {
  EXPECT_EQ(Parsed("-b 115200 -p N -d 7 -s 2 --mode 485 --rx-prefix STX --rx-suffix CRLF "
                   "--tx-prefix none --tx-suffix 0d --gap 20 --hex --queue 5 --port COM3 "
                   "--auto-connect false")
                ->Configuration(),
            "CfgVer=1 model=1 port=com3 baudrate=115200 parity=none bits=7 stopbits=2 mode=RS-485 "
            "rx_prefix=02 rx_suffix=0D0A gap=20 tx_prefix=none tx_suffix=0D hex_tokens=true "
            "token_queue_size=5 autoConnect=false");
  EXPECT_EQ(Parsed("-p mark --mode rs-422")->Given().at("parity"), "mark");
}

TEST(FramingFlags, FlagsWinOverTheConfiguration) {
  EXPECT_EQ(Parsed("-b 19200 --rx-suffix CR")->Apply("CfgVer=1 baudrate=9600 gap=7"),
            "CfgVer=1 baudrate=19200 gap=7 rx_suffix=0D");
}

TEST(FramingFlags, WhatCannotBeRightIsRefused) {
  for (const char* const line :
       {"-b 9601", "-b x", "-p space", "-p \"\"", "-d 9", "-s 0", "--mode RS-485P", "--rx-prefix 2",
        "--tx-suffix STXX", "--gap -1", "--gap x", "--queue 0", "--queue 10001", "--port com17",
        "--auto-connect maybe"}) {
    EXPECT_THROW(Parsed{line}, CLI::ParseError) << line;
  }
}

TEST(FramingFlags, MistakesAreNamedAsTheyWereTyped) {
  try {
    const Parsed parsed("--rx-prefix 2");
    FAIL();
  } catch (const CLI::ParseError& error) {
    EXPECT_EQ(std::string(error.what()).substr(0, 15), "--rx-prefix: \"2");
  }
}

TEST(FramingFlags, TheDriverTakesWhatTheyMake) {
  HostOptions options;
  options.pluginFile = PluginLibrary::DefaultPath();
  HostSession driver(options);
  ASSERT_TRUE(driver.Open().IsDone());
  for (const char* const line : {"", "--rx-prefix STX --tx-suffix none --hex --queue 10000",
                                 "-p mark --auto-connect true --gap 2147483647"}) {
    const HostResult result = driver.Configure(Parsed(line)->Configuration());
    EXPECT_TRUE(result.IsDone()) << line << ": " << result.text;
  }
}

TEST(ConfigKeys, AllowedTexts) {
  EXPECT_EQ(ConfigKeys().size(), 16U);
  EXPECT_EQ(FindConfigKey("bits")->AllowedText(), "7, 8");
  EXPECT_EQ(FindConfigKey("token_queue_size")->AllowedText(), "1 to 10000");
  EXPECT_EQ(FindConfigKey("none"), nullptr);
}

}  // namespace
