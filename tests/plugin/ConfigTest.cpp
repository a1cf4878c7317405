// SPDX-License-Identifier: Apache-2.0
// The configuration text: syntax, keys, defaults, rejections letter for letter.
#include "tests/plugin/PluginFixture.h"

namespace {

class ConfigTest : public ProtocolFixture {
 protected:
  // A fresh protocol each time; "accepted" or the error state.
  std::string Check(const std::string& text) {
    ProtocolUnderTest protocol(plugin_);
    return protocol.Config(text) ? "accepted" : protocol.Error();
  }
  // The com parameters that a text leads to.
  std::string Params(const std::string& text) {
    ProtocolUnderTest protocol(plugin_);
    return protocol.Config(text) ? protocol.ComParams() : protocol.Error();
  }
  // A configuration with one key of the mandatory set replaced or (with an empty entry) left out.
  static std::string With(const std::string& key, const std::string& entry) {
    std::string text = "CfgVer=1";
    for (const auto& pair : {std::pair<std::string, std::string>{"model", "1"},
                             {"port", "com1"},
                             {"baudrate", "9600"},
                             {"parity", "even"},
                             {"bits", "8"},
                             {"stopbits", "1"},
                             {"mode", "RS-232"}}) {
      if (pair.first != key) {
        text += " " + pair.first + "=" + pair.second;
      } else if (!entry.empty()) {
        text += " " + entry;
      }
    }
    return text;
  }
};

TEST_F(ConfigTest, MandatoryKeysOnly) {
  EXPECT_EQ(Params(kMandatory), "com1,9600,even,8,1,RS-232");
  EXPECT_EQ(host_.Log().Count("Setup 9600 1 8 1 0"), 0);
}

TEST_F(ConfigTest, EveryKey) {
  EXPECT_EQ(Params("CfgVer=1 model=1 port=com2 baudrate=115200 parity=none bits=8 stopbits=1 "
                   "mode=RS-485 rx_prefix=02 rx_suffix=0D0A gap=0 tx_prefix=none tx_suffix=0D0A "
                   "hex_tokens=true token_queue_size=500 autoConnect=false"),
            "com2,115200,none,8,1,RS-485");
}

TEST_F(ConfigTest, UnknownFormat) {
  for (const char* text : {"", " ", "CfgVer=2 port=com1", "cfgver=1", "CfgVer = 1", "CfgVer=01",
                           "model=1 port=com1", "CfgVer="}) {
    EXPECT_EQ(Check(text), "-1 Parser: unknown format") << text;
  }
}

TEST_F(ConfigTest, MissingMandatoryKeys) {
  for (const char* key : {"model", "port", "baudrate", "parity", "bits", "stopbits", "mode"}) {
    EXPECT_EQ(Check(With(key, "")), std::string("-1 Parser: parameter '") + key + "' is not found");
  }
}

TEST_F(ConfigTest, TheFirstMissingKeyIsNamed) {
  EXPECT_EQ(Check("CfgVer=1"), "-1 Parser: parameter 'model' is not found");
  EXPECT_EQ(Check("CfgVer=1 model=1"), "-1 Parser: parameter 'port' is not found");
  EXPECT_EQ(Check("CfgVer=1 model=1 mode=RS-232 port=x"),
            "-1 Parser: parameter 'baudrate' is not found");
}

TEST_F(ConfigTest, ParityAndModeWords) {
  const std::string badParity = "-1 Parser: parameter 'parity' has invalid value";
  for (const char* word : {"space", "None", "EVEN", "", "1", "odd2"}) {
    EXPECT_EQ(Check(With("parity", std::string("parity=") + word)), badParity) << word;
  }
  const std::string badMode = "-1 Parser: parameter 'mode' has invalid value";
  for (const char* word : {"RS-485P", "rs-232", "RS232", "", "0", "RS-4222"}) {
    EXPECT_EQ(Check(With("mode", std::string("mode=") + word)), badMode) << word;
  }
  for (const char* word : {"none", "even", "odd", "mark"}) {
    EXPECT_EQ(Check(With("parity", std::string("parity=") + word)), "accepted") << word;
  }
  for (const char* word : {"RS-232", "RS-485", "RS-422"}) {
    EXPECT_EQ(Check(With("mode", std::string("mode=") + word)), "accepted") << word;
  }
}

TEST_F(ConfigTest, ParityIsLookedAtBeforeMode) {
  EXPECT_EQ(Check("CfgVer=1 model=1 port=a baudrate=1 bits=1 stopbits=1 parity=x mode=x"),
            "-1 Parser: parameter 'parity' has invalid value");
}

TEST_F(ConfigTest, IntegersAreReadInAnyBaseAndNeverFail) {
  const struct {
    const char* text;
    const char* value;
  } rows[] = {{"9600", "9600"},
              {"0x2580", "9600"},
              {"0X2580", "9600"},
              {"022600", "9600"},
              {"9600baud", "9600"},
              {"abc", "0"},
              {"", "0"},
              {"-1", "-1"},
              {"+7", "7"},
              {"08", "0"},
              {"0x", "0"},
              {"2147483647", "2147483647"},
              {"2147483648", "2147483647"},
              {"99999999999999999999", "2147483647"},
              {"-2147483649", "-2147483648"},
              {"0xFFFFFFFF", "2147483647"}};
  for (const auto& row : rows) {
    EXPECT_EQ(Params(With("baudrate", std::string("baudrate=") + row.text)),
              std::string("com1,") + row.value + ",even,8,1,RS-232")
        << row.text;
  }
}

TEST_F(ConfigTest, NoRangeTestOnTheSerialNumbers) {
  EXPECT_EQ(Params("CfgVer=1 model=1 port= baudrate=-3 parity=mark bits=99 stopbits=0x11 "
                   "mode=RS-422 gap=-4"),
            ",-3,mark,99,17,RS-422");
}

TEST_F(ConfigTest, QueueSizeRange) {
  const std::string outOfRange = "-1 parameter 'token_queue_size' out of range";
  for (const char* size : {"0", "10001", "-1", "abc", "", "99999999999", "0x2711"}) {
    EXPECT_EQ(Check(Mandatory(std::string("token_queue_size=") + size)), outOfRange) << size;
  }
  for (const char* size : {"1", "10000", "0x10", "010", "500"}) {
    EXPECT_EQ(Check(Mandatory(std::string("token_queue_size=") + size)), "accepted") << size;
  }
}

TEST_F(ConfigTest, BooleanWords) {
  for (const char* key : {"hex_tokens", "autoConnect"}) {
    for (const char* word : {"TRUE", "True", "1", "0", "yes", "", "falsey", "true,"}) {
      EXPECT_EQ(Check(Mandatory(std::string(key) + "=" + word)),
                std::string("-1 Parser: parameter '") + key + "' has illegal value")
          << word;
    }
    for (const char* word : {"true", "false"}) {
      EXPECT_EQ(Check(Mandatory(std::string(key) + "=" + word)), "accepted") << key << word;
    }
  }
}

TEST_F(ConfigTest, FramingTextsMustBeHex) {
  for (const char* key : {"rx_prefix", "rx_suffix", "tx_prefix", "tx_suffix"}) {
    for (const char* text : {"2", "0g", "abc", "None", "NONE", "0x02", "non", "none2", "0D 0"}) {
      if (std::string(text) == "0D 0") continue;  // a blank ends the value: 0D is well-formed
      EXPECT_EQ(Check(Mandatory(std::string(key) + "=" + text)),
                std::string("-1 ") + key + " not in hex format")
          << text;
    }
    for (const char* text : {"", "none", "02", "0d0A", "0D 0", "ABCDEFabcdef0123456789"}) {
      EXPECT_EQ(Check(Mandatory(std::string(key) + "=" + text)), "accepted") << key << text;
    }
    // Also without hex tokens, and a space that is written out is no digit.
    EXPECT_EQ(Check(Mandatory(std::string("hex_tokens=false ") + key + "=0&nbsp;")),
              std::string("-1 ") + key + " not in hex format");
  }
}

TEST_F(ConfigTest, TheOrderOfTheChecks) {
  // Reading comes first, key by key; then the queue size; then the framing texts in order.
  EXPECT_EQ(Check(Mandatory("autoConnect=x token_queue_size=0 rx_prefix=2")),
            "-1 Parser: parameter 'autoConnect' has illegal value");
  EXPECT_EQ(Check(Mandatory("hex_tokens=x autoConnect=x")),
            "-1 Parser: parameter 'hex_tokens' has illegal value");
  EXPECT_EQ(Check(Mandatory("token_queue_size=0 rx_prefix=2")),
            "-1 parameter 'token_queue_size' out of range");
  EXPECT_EQ(Check(Mandatory("tx_suffix=2 tx_prefix=2 rx_suffix=2 rx_prefix=2")),
            "-1 rx_prefix not in hex format");
  EXPECT_EQ(Check(Mandatory("tx_suffix=2 tx_prefix=2 rx_suffix=2")),
            "-1 rx_suffix not in hex format");
  EXPECT_EQ(Check(Mandatory("tx_suffix=2 tx_prefix=2")), "-1 tx_prefix not in hex format");
  // The words for parity and mode come last.
  EXPECT_EQ(Check(With("parity", "parity=x") + " rx_prefix=2"), "-1 rx_prefix not in hex format");
}

TEST_F(ConfigTest, ValuesEndAtWhiteSpace) {
  for (const char* blank : {" ", "\t", "\n", "\v", "\f", "\r", "\r\n", "   "}) {
    std::string text = "CfgVer=1";
    for (const char* entry : {"model=1", "port=com4", "baudrate=9600", "parity=even", "bits=8",
                              "stopbits=1", "mode=RS-232"}) {
      text += std::string(blank) + entry;
    }
    EXPECT_EQ(Params(text), "com4,9600,even,8,1,RS-232");
  }
}

TEST_F(ConfigTest, KeysStandBehindWhiteSpaceAndTheFirstWins) {
  EXPECT_EQ(Params(With("port", "xport=com5 port=com1")), "com1,9600,even,8,1,RS-232");
  EXPECT_EQ(Params(With("port", "port=com3 port=com2")), "com3,9600,even,8,1,RS-232");
  EXPECT_EQ(Params(With("port", "port=")), ",9600,even,8,1,RS-232");
  EXPECT_EQ(Params(With("port", "Port=com1")), "-1 Parser: parameter 'port' is not found");
  EXPECT_EQ(Params(With("port", "port =com1")), "-1 Parser: parameter 'port' is not found");
  EXPECT_EQ(Params(With("port", "port=a=b")), "a=b,9600,even,8,1,RS-232");
}

TEST_F(ConfigTest, AKeyMayStandDirectlyBehindTheMarker) {
  EXPECT_EQ(Params("CfgVer=1model=1 port=com1 baudrate=9600 parity=even bits=8 stopbits=1 "
                   "mode=RS-232"),
            "com1,9600,even,8,1,RS-232");
  // The marker is plain text, so a longer version number opens the section as well.
  EXPECT_EQ(Params("CfgVer=12 model=1 port=com1 baudrate=9600 parity=even bits=8 stopbits=1 "
                   "mode=RS-232"),
            "com1,9600,even,8,1,RS-232");
}

TEST_F(ConfigTest, OnlyTheFirstSectionOfVersionOneCounts) {
  const std::string keys = "model=1 baudrate=9600 parity=even bits=8 stopbits=1 mode=RS-232";
  EXPECT_EQ(Params("CfgVer=2 port=com8 CfgVer=1 port=com3 " + keys + " CfgVer=3 port=com9"),
            "com3,9600,even,8,1,RS-232");
  EXPECT_EQ(Params("port=com7 CfgVer=1 " + keys + " CfgVer=2 port=com9"),
            "-1 Parser: parameter 'port' is not found");
  EXPECT_EQ(Params("CfgVer=1 " + keys + " CfgVer=1 port=com9"),
            "-1 Parser: parameter 'port' is not found");
}

TEST_F(ConfigTest, ASpaceIsWrittenOut) {
  EXPECT_EQ(Params(With("port", "port=two&nbsp;&nbsp;words&nbsp;")),
            "two  words ,9600,even,8,1,RS-232");
  EXPECT_EQ(Params(With("port", "port=&amp;nbsp;&nbsp")), "&amp;nbsp;&nbsp,9600,even,8,1,RS-232");
}

TEST_F(ConfigTest, CommonKeysTakeNoNode) {
  EXPECT_EQ(Params(With("port", "Node1::port=com2")), "-1 Parser: parameter 'port' is not found");
  EXPECT_EQ(Params(With("port", "Node1::port=com2 port=com1")), "com1,9600,even,8,1,RS-232");
}

TEST_F(ConfigTest, TheModelWithoutANodeIsMandatory) {
  EXPECT_EQ(Check(With("model", "Node1::model=1")), "-1 Parser: parameter 'model' is not found");
}

TEST_F(ConfigTest, NodesHaveModelsOfTheirOwn) {
  ProtocolUnderTest protocol(plugin_);
  ASSERT_TRUE(protocol.Config(With("model", "model=1 Node1::model=2 Node7::model=1 Node9::x=1")));
  EXPECT_EQ(protocol.Tag("1?connect?boolean"), nullptr);
  EXPECT_NE(protocol.Tag("7?connect?boolean"), nullptr);
  EXPECT_NE(protocol.Tag("9?connect?boolean"), nullptr);
  EXPECT_NE(protocol.Tag("4?connect?boolean"), nullptr);
}

TEST_F(ConfigTest, TheNodeScanIsTextual) {
  ProtocolUnderTest protocol(plugin_);
  // "Node::" is node 0; "NodeA::" is none; a node number may have leading zeros, its key may not.
  ASSERT_TRUE(protocol.Config(
      With("model", "model=1 Node::x=1 NodeA::model=2 Node0::model=2 Node03::x=1 Node3::model=2")));
  EXPECT_EQ(protocol.Tag("0?connect?boolean"), nullptr);
  EXPECT_EQ(protocol.Tag("3?connect?boolean"), nullptr);
  EXPECT_NE(protocol.Tag("1?connect?boolean"), nullptr);
}

TEST_F(ConfigTest, AModelMayContainASpace) {
  ProtocolUnderTest protocol(plugin_);
  ASSERT_TRUE(protocol.Config(With("model", "model=1 Node2::model=1&nbsp;")));
  EXPECT_EQ(protocol.Tag("2?connect?boolean"), nullptr);
}

TEST_F(ConfigTest, ASecondConfigReplacesAllButTheNodes) {
  ASSERT_TRUE(P().Config(With("model", "model=1 Node1::model=1")));
  ASSERT_TRUE(
      P().Config("CfgVer=1 model=2 Node1::model=2 Node3::model=1 port=com9 baudrate=300 "
                 "parity=odd bits=7 stopbits=2 mode=RS-422"));
  EXPECT_EQ(P().ComParams(), "com9,300,odd,7,2,RS-422");
  EXPECT_NE(P().Tag("1?connect?boolean"), nullptr) << "the first record of a node stays";
  EXPECT_NE(P().Tag("3?connect?boolean"), nullptr);
  EXPECT_EQ(P().Tag("0?connect?boolean"), nullptr) << "the default model is replaced";
}

TEST_F(ConfigTest, ASecondConfigGoesBackToTheDefaults) {
  ASSERT_TRUE(P().Config(Mandatory("autoConnect=false tx_prefix=02 gap=70")));
  ASSERT_TRUE(P().Config(Mandatory()));
  ASSERT_NE(P()->Start(), 0);
  EXPECT_EQ(host_.Log().Count("OpenPort com1"), 1);
  EXPECT_EQ(P().ReadText("SP_TxPrefix"), "");
  EXPECT_EQ(P().ReadNumber("SP_Gap"), 0U);
}

TEST_F(ConfigTest, ARejectedConfigLeavesTheSerialSettings) {
  ASSERT_TRUE(P().Config(Mandatory()));
  EXPECT_FALSE(P().Config(With("mode", "") + " port=com7"));
  EXPECT_EQ(P().ComParams(), "com1,9600,even,8,1,RS-232");
  EXPECT_FALSE(P().Config("nonsense"));
  EXPECT_EQ(P().ComParams(), "com1,9600,even,8,1,RS-232");
}

// The words are looked at after the numbers have been taken over.
TEST_F(ConfigTest, ABadWordComesAfterTheNumbers) {
  ASSERT_TRUE(P().Config(Mandatory()));
  EXPECT_FALSE(
      P().Config("CfgVer=1 model=1 port=com5 baudrate=300 parity=x bits=7 stopbits=2 "
                 "mode=RS-422"));
  EXPECT_EQ(P().ComParams(), "com5,300,even,7,2,RS-232");
  EXPECT_FALSE(
      P().Config("CfgVer=1 model=1 port=com6 baudrate=600 parity=odd bits=8 stopbits=1 "
                 "mode=x"));
  EXPECT_EQ(P().ComParams(), "com6,600,odd,8,1,RS-232");
}

TEST_F(ConfigTest, DefaultsOfTheOptionalKeys) {
  Run();
  EXPECT_EQ(P().ReadText("SP_RxPrefix"), "");
  EXPECT_EQ(P().ReadText("SP_RxSuffix"), "");
  EXPECT_EQ(P().ReadText("SP_TxPrefix"), "");
  EXPECT_EQ(P().ReadText("SP_TxSuffix"), "");
  EXPECT_EQ(P().ReadNumber("SP_Gap"), 0U);
  EXPECT_FALSE(P().ReadFlag("SP_HexTokens"));
  EXPECT_EQ(P().ReadNumber("SP_TokenQueueSize"), 100U);
  EXPECT_TRUE(P().ReadFlag("connect"));
}

TEST_F(ConfigTest, ConfiguredOptionalKeysReachTheDriver) {
  Run("rx_prefix=0a rx_suffix=0D0A tx_prefix=none tx_suffix=FF gap=0x20 hex_tokens=true "
      "token_queue_size=7 autoConnect=false");
  EXPECT_EQ(P().ReadText("SP_RxPrefix"), "0a");
  EXPECT_EQ(P().ReadText("SP_RxSuffix"), "0D0A");
  EXPECT_EQ(P().ReadText("SP_TxPrefix"), "none");
  EXPECT_EQ(P().ReadText("SP_TxSuffix"), "FF");
  EXPECT_EQ(P().ReadNumber("SP_Gap"), 32U);
  EXPECT_TRUE(P().ReadFlag("SP_HexTokens"));
  EXPECT_EQ(P().ReadNumber("SP_TokenQueueSize"), 7U);
  EXPECT_FALSE(P().ReadFlag("connect"));
}

TEST_F(ConfigTest, ConfigAsksNothingOfTheHost) {
  EXPECT_TRUE(P().Config(Mandatory("rx_prefix=02")));
  EXPECT_FALSE(P().Config(Mandatory("rx_prefix=2")));
  EXPECT_EQ(Calls(), "");
}

}  // namespace
