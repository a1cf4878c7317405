// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <string>
#include <utility>
#include <vector>

#include "driver/ParamManager.h"

using _LOKA::CommonParams;
using _LOKA::ParamManager;

namespace {

const char* const kRequired =
    "CfgVer=1 model=1 port=com1 baudrate=9600 parity=even bits=8 stopbits=1 mode=RS-232";

// The required keys with more behind them.
std::string With(const std::string& more) { return std::string(kRequired) + " " + more; }

// The required keys without one.
std::string Without(const std::string& key) {
  const std::string all = kRequired;
  const std::size_t begin = all.find(" " + key + "=");
  return all.substr(0, begin) + (all.find(' ', begin + 1) == std::string::npos
                                     ? ""
                                     : all.substr(all.find(' ', begin + 1)));
}

CommonParams Accepted(const std::string& cfg) {
  ParamManager params;
  EXPECT_TRUE(params.parse(cfg.c_str())) << cfg << ": " << params.getLastError();
  EXPECT_STREQ(params.getLastError(), "");
  return *params.getCommonParams();
}

void ExpectRefused(const std::string& cfg, const std::string& message) {
  ParamManager params;
  EXPECT_FALSE(params.parse(cfg.c_str())) << cfg;
  EXPECT_EQ(params.getLastError(), message) << cfg;
}

}  // namespace

TEST(ParamManagerTest, IsEmptyBeforeTheFirstParse) {
  const ParamManager params;
  EXPECT_STREQ(params.getLastError(), "");
  ASSERT_NE(params.getCommonParams(), nullptr);
  EXPECT_EQ(params.getCommonParams()->port, "");
  EXPECT_FALSE(params.getCommonParams()->autoConnect);
  ASSERT_NE(params.getNodeParams(0), nullptr);
  EXPECT_EQ(params.getNodeParams(0)->nodeId, -1);
  EXPECT_EQ(params.getNodeParams(0)->model, "");
}

TEST(ParamManagerTest, RequiredKeysGiveTheDefaultsOfTheOthers) {
  const CommonParams common = Accepted(kRequired);
  EXPECT_EQ(common.port, "com1");
  EXPECT_EQ(common.baudrate, 9600);
  EXPECT_EQ(common.parity, "even");
  EXPECT_EQ(common.bits, 8);
  EXPECT_EQ(common.stopbits, 1);
  EXPECT_EQ(common.mode, "RS-232");
  EXPECT_EQ(common.rx_prefix, "");
  EXPECT_EQ(common.rx_suffix, "");
  EXPECT_EQ(common.gap, 0);
  EXPECT_EQ(common.tx_prefix, "");
  EXPECT_EQ(common.tx_suffix, "");
  EXPECT_FALSE(common.hex_tokens);
  EXPECT_EQ(common.token_queue_size, 100);
  EXPECT_TRUE(common.autoConnect);
}

TEST(ParamManagerTest, ReadsEveryKey) {
  const CommonParams common = Accepted(
      "CfgVer=1 model=1 port=com2 baudrate=115200 parity=none bits=7 stopbits=2 mode=RS-485 "
      "rx_prefix=02 rx_suffix=0D0A gap=25 tx_prefix=none tx_suffix=0d0A hex_tokens=true "
      "token_queue_size=500 autoConnect=false");
  EXPECT_EQ(common.port, "com2");
  EXPECT_EQ(common.baudrate, 115200);
  EXPECT_EQ(common.parity, "none");
  EXPECT_EQ(common.bits, 7);
  EXPECT_EQ(common.stopbits, 2);
  EXPECT_EQ(common.mode, "RS-485");
  EXPECT_EQ(common.rx_prefix, "02");
  EXPECT_EQ(common.rx_suffix, "0D0A");
  EXPECT_EQ(common.gap, 25);
  EXPECT_EQ(common.tx_prefix, "none");
  EXPECT_EQ(common.tx_suffix, "0d0A");
  EXPECT_TRUE(common.hex_tokens);
  EXPECT_EQ(common.token_queue_size, 500);
  EXPECT_FALSE(common.autoConnect);
}

TEST(ParamManagerTest, EveryRequiredKeyIsMissed) {
  for (const char* key : {"model", "port", "baudrate", "parity", "bits", "stopbits", "mode"}) {
    ExpectRefused(Without(key), std::string("Parser: parameter '") + key + "' is not found");
  }
}

TEST(ParamManagerTest, RequiredKeysAreReadInTheirOrder) {
  const std::vector<std::string> keys = {"model", "port",     "baudrate", "parity",
                                         "bits",  "stopbits", "mode"};
  // Each one alone in front, all behind it missing: the next one is named.
  std::string cfg = "CfgVer=1";
  for (const std::string& key : keys) {
    ExpectRefused(cfg + " hex_tokens=x", "Parser: parameter '" + key + "' is not found");
    cfg += " " + key + "=1";
  }
  ExpectRefused(cfg + " hex_tokens=x", "Parser: parameter 'hex_tokens' has illegal value");
}

TEST(ParamManagerTest, UnknownFormatIsRefused) {
  ExpectRefused("CfgVer=2 model=1", "Parser: unknown format");
  ExpectRefused("", "Parser: unknown format");
}

TEST(ParamManagerTest, FirstBadKeyDecidesTheMessage) {
  ExpectRefused("CfgVer=1", "Parser: parameter 'model' is not found");
  ExpectRefused("CfgVer=1 model=1", "Parser: parameter 'port' is not found");
  ExpectRefused(Without("mode") + " hex_tokens=1", "Parser: parameter 'mode' is not found");
  ExpectRefused(With("autoConnect=1 hex_tokens=1"),
                "Parser: parameter 'hex_tokens' has illegal value");
  ExpectRefused(With("autoConnect=1 token_queue_size=0"),
                "Parser: parameter 'autoConnect' has illegal value");
  ExpectRefused(With("token_queue_size=0 rx_prefix=2"),
                "parameter 'token_queue_size' out of range");
  ExpectRefused(With("rx_prefix=2 rx_suffix=2 tx_prefix=2 tx_suffix=2"),
                "rx_prefix not in hex format");
}

// --- numbers ---

TEST(ParamManagerTest, NumbersHaveBaseZeroAndNeverFail) {
  EXPECT_EQ(Accepted(With("token_queue_size=0x10")).token_queue_size, 16);
  EXPECT_EQ(Accepted(With("gap=010")).gap, 8);
  EXPECT_EQ(Accepted(With("gap=-5")).gap, -5);
  EXPECT_EQ(Accepted(With("gap=25ms")).gap, 25);
  EXPECT_EQ(Accepted(With("gap=soon")).gap, 0);
  EXPECT_EQ(Accepted(With("gap=")).gap, 0);
  EXPECT_EQ(Accepted(With("gap=99999999999")).gap, 2147483647);
  EXPECT_EQ(Accepted(Without("baudrate") + " baudrate=abc").baudrate, 0);
}

TEST(ParamManagerTest, QueueSizeHasARange) {
  for (const char* size : {"0", "10001", "-1", "", "many", "99999999999"}) {
    ExpectRefused(With(std::string("token_queue_size=") + size),
                  "parameter 'token_queue_size' out of range");
  }
  EXPECT_EQ(Accepted(With("token_queue_size=1")).token_queue_size, 1);
  EXPECT_EQ(Accepted(With("token_queue_size=10000")).token_queue_size, 10000);
}

TEST(ParamManagerTest, OtherNumbersAndWordsAreNotChecked) {
  const CommonParams common = Accepted(
      "CfgVer=1 model=x port= baudrate=1 parity=space bits=99 stopbits=-1 mode=RS-485P gap=-1");
  EXPECT_EQ(common.port, "");
  EXPECT_EQ(common.parity, "space");
  EXPECT_EQ(common.bits, 99);
  EXPECT_EQ(common.stopbits, -1);
  EXPECT_EQ(common.mode, "RS-485P");
}

// --- words and texts ---

TEST(ParamManagerTest, SwitchesAreTrueOrFalse) {
  for (const char* word : {"TRUE", "True", "1", "0", "", "yes"}) {
    ExpectRefused(With(std::string("hex_tokens=") + word),
                  "Parser: parameter 'hex_tokens' has illegal value");
    ExpectRefused(With(std::string("autoConnect=") + word),
                  "Parser: parameter 'autoConnect' has illegal value");
  }
  EXPECT_TRUE(Accepted(With("hex_tokens=true autoConnect=true")).autoConnect);
  EXPECT_FALSE(Accepted(With("hex_tokens=false autoConnect=true")).hex_tokens);
}

TEST(ParamManagerTest, TextsMayHoldSpaces) {
  EXPECT_EQ(Accepted(Without("port") + " port=/dev/my&nbsp;port").port, "/dev/my port");
  ParamManager params;
  ASSERT_TRUE(params.parse(("CfgVer=1 model=a&nbsp;b" + std::string(kRequired + 16)).c_str()));
  EXPECT_EQ(params.getNodeParams(0)->model, "a b");
}

TEST(ParamManagerTest, FramingTextsAreHexText) {
  for (const std::string key : {"rx_prefix", "rx_suffix", "tx_prefix", "tx_suffix"}) {
    for (const char* good : {"", "02", "0d0A", "none", "FFfe00"}) {
      Accepted(With(key + "=" + good));
    }
    for (const char* bad : {"2", "0D0", "0g", "None", "0x02", "&nbsp;2"}) {
      ExpectRefused(With(key + "=" + bad), key + " not in hex format");
      ExpectRefused(With(key + "=" + bad + " hex_tokens=false"), key + " not in hex format");
    }
  }
}

// --- nodes ---

TEST(ParamManagerTest, NodesHaveTheirModelOrTheCommonOne) {
  ParamManager params;
  ASSERT_TRUE(params.parse(With("Node3::model=2 Node4::x=1 Node5::model=a&nbsp;b").c_str()));
  EXPECT_EQ(params.getNodeParams(3)->nodeId, 3);
  EXPECT_EQ(params.getNodeParams(3)->model, "2");
  EXPECT_EQ(params.getNodeParams(4)->nodeId, 4);
  EXPECT_EQ(params.getNodeParams(4)->model, "1");
  EXPECT_EQ(params.getNodeParams(5)->model, "a b");
  EXPECT_EQ(params.getNodeParams(9)->nodeId, -1);
  EXPECT_EQ(params.getNodeParams(9)->model, "1");
  EXPECT_EQ(params.getNodeParams(-1)->nodeId, -1);
}

TEST(ParamManagerTest, CommonModelIsRequiredEvenWhenEveryNodeHasItsOwn) {
  ExpectRefused(Without("model") + " Node1::model=2", "Parser: parameter 'model' is not found");
}

TEST(ParamManagerTest, PrefixedCommonKeyIsIgnored) {
  EXPECT_EQ(Accepted(With("Node1::port=com2")).port, "com1");
  ExpectRefused(Without("port") + " Node1::port=com2", "Parser: parameter 'port' is not found");
}

// --- a second parse, and a failed one ---

TEST(ParamManagerTest, SecondParseAddsNodesAndReplacesTheRest) {
  ParamManager params;
  ASSERT_TRUE(params.parse(With("Node3::model=first gap=5").c_str()));
  ASSERT_TRUE(params.parse(
      "CfgVer=1 model=x Node3::model=second Node4::model=new port=com9 baudrate=300 parity=none "
      "bits=7 stopbits=2 mode=RS-422"));
  EXPECT_EQ(params.getNodeParams(3)->model, "first");
  EXPECT_EQ(params.getNodeParams(4)->model, "new");
  EXPECT_EQ(params.getNodeParams(9)->model, "x");
  EXPECT_EQ(params.getCommonParams()->port, "com9");
  EXPECT_EQ(params.getCommonParams()->gap, 0);
}

TEST(ParamManagerTest, FailedParseKeepsWhatItDidNotReach) {
  ParamManager params;
  ASSERT_TRUE(params.parse(With("gap=5").c_str()));
  EXPECT_FALSE(params.parse("CfgVer=1 model=x port=com9 baudrate=300"));
  EXPECT_STREQ(params.getLastError(), "Parser: parameter 'parity' is not found");
  EXPECT_EQ(params.getCommonParams()->port, "com9");
  EXPECT_EQ(params.getCommonParams()->baudrate, 300);
  EXPECT_EQ(params.getCommonParams()->parity, "even");
  EXPECT_EQ(params.getCommonParams()->gap, 5);
}

TEST(ParamManagerTest, FailedOptionalKeyHasItsDefaultAndKeepsThoseBehindIt) {
  ParamManager params;
  ASSERT_TRUE(params.parse(
      With("rx_prefix=01 gap=5 hex_tokens=true token_queue_size=7 autoConnect=false").c_str()));
  EXPECT_FALSE(params.parse(With("gap=6 hex_tokens=x token_queue_size=8").c_str()));
  EXPECT_EQ(params.getCommonParams()->rx_prefix, "");
  EXPECT_EQ(params.getCommonParams()->gap, 6);
  EXPECT_FALSE(params.getCommonParams()->hex_tokens);
  EXPECT_EQ(params.getCommonParams()->token_queue_size, 7);
  EXPECT_FALSE(params.getCommonParams()->autoConnect);
}

TEST(ParamManagerTest, NodesReadBeforeAFailureStay) {
  ParamManager params;
  EXPECT_FALSE(params.parse("CfgVer=1 model=1 Node3::model=2"));
  EXPECT_EQ(params.getNodeParams(3)->model, "2");
}
