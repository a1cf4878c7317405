// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "protlib/CfgParser.h"

namespace {

std::vector<int> NodesOf(const std::string& cfg) {
  const CfgParser parser(cfg.c_str());
  std::vector<int> nodes;
  for (int i = 0; i < parser.GetNodeCount(); ++i) nodes.push_back(parser.GetNodeID(i));
  return nodes;
}

// The raw value of a key, "(null)" without one.
std::string ParamOf(const std::string& cfg, const char* name) {
  CfgParser parser(cfg.c_str());
  const char* value = parser.GetParam(name);
  return value != nullptr ? value : "(null)";
}

struct LookUp {
  CfgParser::parseResult result;
  std::string value;
};

LookUp Find(const std::string& cfg, const char* name, int node, int flags) {
  CfgParser parser(cfg.c_str());
  LookUp found;
  found.value = "untouched";
  found.result = parser.getParam(name, node, found.value, flags);
  return found;
}

void ExpectFound(const std::string& cfg, const char* name, int node, int flags,
                 const std::string& value) {
  const LookUp found = Find(cfg, name, node, flags);
  EXPECT_EQ(found.result, CfgParser::prOk) << cfg;
  EXPECT_EQ(found.value, value) << cfg;
}

void ExpectRefused(const std::string& cfg, const char* name, int node, int flags,
                   CfgParser::parseResult result) {
  const LookUp found = Find(cfg, name, node, flags);
  EXPECT_EQ(found.result, result) << cfg;
  EXPECT_EQ(found.value, "untouched") << cfg;
}

const char* const kMandatoryKeys =
    "CfgVer=1 model=1 port=com1 baudrate=9600 parity=even bits=8 stopbits=1 mode=RS-232";

}  // namespace

TEST(CfgParserTest, NumbersItsResultsAndFlagsAsTheHostKnowsThem) {
  EXPECT_EQ(CfgParser::prOk, 0);
  EXPECT_EQ(CfgParser::prNodeDependent, 1);
  EXPECT_EQ(CfgParser::prNotFound, 2);
  EXPECT_EQ(CfgParser::prIllegalValue, 3);
  EXPECT_EQ(CfgParser::prCantBePrefixed, 4);
  EXPECT_EQ(CfgParser::prCantBeNodeIndependent, 5);
  EXPECT_EQ(CfgParser::prInvalidSpecification, 6);
  EXPECT_EQ(static_cast<int>(CfgParser::cfgCommonOnly), 1);
  EXPECT_EQ(static_cast<int>(CfgParser::cfgNodeOnly), 2);
}

// --- choice of the section ---

TEST(CfgParserTest, ReadsTheMandatoryKeys) {
  const CfgParser parser(kMandatoryKeys);
  EXPECT_TRUE(parser.KnownFormat());
  EXPECT_EQ(parser.GetNodeCount(), 0);
  EXPECT_EQ(ParamOf(kMandatoryKeys, "model"), "1");
  EXPECT_EQ(ParamOf(kMandatoryKeys, "port"), "com1");
  EXPECT_EQ(ParamOf(kMandatoryKeys, "baudrate"), "9600");
  EXPECT_EQ(ParamOf(kMandatoryKeys, "mode"), "RS-232");
}

TEST(CfgParserTest, ReadsEveryKey) {
  const std::string cfg =
      "CfgVer=1 model=1 port=com2 baudrate=115200 parity=none bits=8 stopbits=1 mode=RS-485 "
      "rx_prefix=02 rx_suffix=0D0A gap=0 tx_prefix=none tx_suffix=0D0A hex_tokens=true "
      "token_queue_size=500 autoConnect=false";
  EXPECT_EQ(ParamOf(cfg, "rx_prefix"), "02");
  EXPECT_EQ(ParamOf(cfg, "rx_suffix"), "0D0A");
  EXPECT_EQ(ParamOf(cfg, "gap"), "0");
  EXPECT_EQ(ParamOf(cfg, "tx_prefix"), "none");
  EXPECT_EQ(ParamOf(cfg, "token_queue_size"), "500");
  EXPECT_EQ(ParamOf(cfg, "autoConnect"), "false");
}

TEST(CfgParserTest, TextWithoutTheVersionIsAnUnknownFormat) {
  for (const char* cfg : {"", "CfgVer=2 port=com1", "CfgVer= 1", "cfgver=1", "CfgVer"}) {
    EXPECT_FALSE(CfgParser(cfg).KnownFormat()) << cfg;
  }
}

TEST(CfgParserTest, UnknownFormatHasNoNodesAndKeepsTheWholeText) {
  EXPECT_TRUE(NodesOf("CfgVer=2 Node1::model=1").empty());
  EXPECT_EQ(ParamOf("CfgVer=2 port=com1", "port"), "com1");
}

TEST(CfgParserTest, TakesTheFirstSectionOfVersionOne) {
  const std::string cfg = "CfgVer=2 a=b CfgVer=1 port=com3 CfgVer=3 port=com9";
  EXPECT_TRUE(CfgParser(cfg.c_str()).KnownFormat());
  EXPECT_EQ(ParamOf(cfg, "port"), "com3");
  EXPECT_EQ(ParamOf(cfg, "a"), "(null)");
  EXPECT_EQ(ParamOf("CfgVer=1 port=com1 CfgVer=1 port=com2 gap=7", "gap"), "(null)");
}

TEST(CfgParserTest, NodesOfOtherSectionsDoNotCount) {
  const std::string cfg = "CfgVer=2 Node1::a=1 CfgVer=1 Node2::a=1 CfgVer=3 Node3::a=1";
  EXPECT_EQ(NodesOf(cfg), std::vector<int>{2});
}

TEST(CfgParserTest, MarkIsAPlainSubstring) {
  EXPECT_TRUE(CfgParser("CfgVer=12 port=com1").KnownFormat());
  EXPECT_EQ(ParamOf("CfgVer=12=x", "2"), "x");  // the section's text begins with the "2"
  EXPECT_TRUE(CfgParser("xCfgVer=1").KnownFormat());
}

TEST(CfgParserTest, SectionMayBeginDirectlyBehindTheMark) {
  EXPECT_EQ(ParamOf("CfgVer=1port=com1", "port"), "com1");
}

TEST(CfgParserTest, SectionMayBeEmpty) {
  EXPECT_TRUE(CfgParser("CfgVer=1").KnownFormat());
  EXPECT_EQ(ParamOf("CfgVer=1", "port"), "(null)");
  EXPECT_EQ(ParamOf("CfgVer=1CfgVer=1 port=com1", "port"), "(null)");
}

// --- nodes ---

TEST(CfgParserTest, ListsNodesInOrderOfFirstAppearance) {
  EXPECT_EQ(NodesOf("CfgVer=1 model=1 Node1::model=1 Node7::model=1 port=com1"),
            (std::vector<int>{1, 7}));
  EXPECT_EQ(NodesOf("CfgVer=1 Node9::a=1 Node3::a=1 Node9::b=1"), (std::vector<int>{9, 3}));
  EXPECT_EQ(NodesOf("CfgVer=1 Node2::a=1 Node2::b=2"), std::vector<int>{2});
}

TEST(CfgParserTest, NodeWithoutDigitsIsNodeZero) {
  EXPECT_EQ(NodesOf("CfgVer=1 Node::x=1"), std::vector<int>{0});
  EXPECT_EQ(NodesOf("CfgVer=1 Node::x=1 Node0::y=1 Node00::z=1"), std::vector<int>{0});
}

TEST(CfgParserTest, OnlyDigitsMayStandBetweenNodeAndSeparator) {
  EXPECT_TRUE(NodesOf("CfgVer=1 NodeA::x=1").empty());
  EXPECT_TRUE(NodesOf("CfgVer=1 Node1A::x=1").empty());
  EXPECT_TRUE(NodesOf("CfgVer=1 Node-1::x=1").empty());
  EXPECT_TRUE(NodesOf("CfgVer=1 Node1:x::y=1").empty());
  EXPECT_TRUE(NodesOf("CfgVer=1 node1::x=1").empty());
  EXPECT_EQ(NodesOf("CfgVer=1 NodeA::x=1 Node4::x=1"), std::vector<int>{4});
  EXPECT_EQ(NodesOf("CfgVer=1 NodeNode5::x=1"), std::vector<int>{5});
}

TEST(CfgParserTest, NodeWithoutSeparatorBehindItEndsTheScan) {
  EXPECT_TRUE(NodesOf("CfgVer=1 Node1 Node2 Node").empty());
  EXPECT_EQ(NodesOf("CfgVer=1 Node1::a=b Node2:"), std::vector<int>{1});
}

TEST(CfgParserTest, NodeNumbersAreDecimal) {
  EXPECT_EQ(NodesOf("CfgVer=1 Node010::x=1"), std::vector<int>{10});
}

TEST(CfgParserTest, NodeNumbersSaturate) {
  EXPECT_EQ(NodesOf("CfgVer=1 Node2147483647::x=1"), std::vector<int>{2147483647});
  EXPECT_EQ(NodesOf("CfgVer=1 Node2147483648::x=1"), std::vector<int>{2147483647});
  EXPECT_EQ(NodesOf("CfgVer=1 Node99999999999999999999999::x=1"), std::vector<int>{2147483647});
}

TEST(CfgParserTest, NodeInsideAValueCounts) {
  EXPECT_EQ(NodesOf("CfgVer=1 comment=xNode12::y"), std::vector<int>{12});
}

TEST(CfgParserTest, NodeIndexOutsideGivesZero) {
  const CfgParser parser("CfgVer=1 Node5::x=1");
  EXPECT_EQ(parser.GetNodeID(0), 5);
  EXPECT_EQ(parser.GetNodeID(1), 0);
  EXPECT_EQ(parser.GetNodeID(1000), 0);
  EXPECT_EQ(parser.GetNodeID(-1), 0);
}

// --- raw look-up ---

TEST(CfgParserTest, KeyHasToFollowWhiteSpace) {
  EXPECT_EQ(ParamOf("CfgVer=1 xport=com5 port=com1", "port"), "com1");
  EXPECT_EQ(ParamOf("CfgVer=1 Node1::model=2 model=1", "model"), "1");
  EXPECT_EQ(ParamOf("CfgVer=1 xport=com5", "port"), "(null)");
}

TEST(CfgParserTest, EveryKindOfWhiteSpaceSeparates) {
  for (const char space : {' ', '\t', '\n', '\v', '\f', '\r'}) {
    const std::string cfg = std::string("CfgVer=1") + space + "a=1" + space + "port=com1" + space;
    EXPECT_EQ(ParamOf(cfg, "port"), "com1") << static_cast<int>(space);
    EXPECT_EQ(ParamOf(cfg, "a"), "1") << static_cast<int>(space);
  }
}

TEST(CfgParserTest, NoOtherCharacterSeparates) {
  for (int code = 1; code < 256; ++code) {
    const char c = static_cast<char>(code);
    if (c == ' ' || (c >= '\t' && c <= '\r')) continue;
    const std::string cfg = std::string("CfgVer=1 x") + c + "port=com1" + c + "2";
    EXPECT_EQ(ParamOf(cfg, "port"), "(null)") << code;
    EXPECT_EQ(ParamOf(std::string("CfgVer=1 port=com1") + c + "2", "port"),
              std::string("com1") + c + "2")
        << code;
  }
}

TEST(CfgParserTest, FirstOfTwoValuesWins) {
  EXPECT_EQ(ParamOf("CfgVer=1 port=com1 port=com2", "port"), "com1");
}

TEST(CfgParserTest, ValueMayBeEmpty) {
  EXPECT_EQ(ParamOf("CfgVer=1 port= baudrate=9600", "port"), "");
  EXPECT_EQ(ParamOf("CfgVer=1 port=", "port"), "");
  ExpectFound("CfgVer=1 port= baudrate=9600", "port", -1, 0, "");
}

TEST(CfgParserTest, ValueMayHoldEqualSigns) {
  EXPECT_EQ(ParamOf("CfgVer=1 a=b=c", "a"), "b=c");
  EXPECT_EQ(ParamOf("CfgVer=1 a=b=c", "b"), "(null)");
}

TEST(CfgParserTest, KeysAreCaseSensitive) {
  EXPECT_EQ(ParamOf("CfgVer=1 Port=com1", "port"), "(null)");
}

TEST(CfgParserTest, BlankInFrontOfTheEqualSignHidesTheKey) {
  EXPECT_EQ(ParamOf("CfgVer=1 port =com1", "port"), "(null)");
}

TEST(CfgParserTest, FoundValueStaysUntilTheNextLookUp) {
  CfgParser parser("CfgVer=1 port=com1 mode=RS-232");
  const char* port = parser.GetParam("port");
  ASSERT_STREQ(port, "com1");
  EXPECT_STREQ(parser.GetParam("mode"), "RS-232");
}

// --- look-up by the node rules ---

TEST(CfgParserTest, NodeFallsBackToTheCommonValue) {
  const std::string cfg = "CfgVer=1 model=1 Node1::model=2 Node7::model=3";
  ExpectFound(cfg, "model", 1, 0, "2");
  ExpectFound(cfg, "model", 7, 0, "3");
  ExpectFound(cfg, "model", 4, 0, "1");
  ExpectFound(cfg, "model", -1, 0, "1");
  ExpectFound(cfg, "model", 4, CfgParser::cfgCommonOnly, "1");
}

TEST(CfgParserTest, NodeParameterThatIsNowhereIsNotFound) {
  const std::string cfg = "CfgVer=1 Node1::model=2";
  ExpectRefused(cfg, "model", 4, 0, CfgParser::prNotFound);
  ExpectRefused(cfg, "model", -1, 0, CfgParser::prNotFound);
  ExpectRefused(cfg, "port", 1, CfgParser::cfgNodeOnly, CfgParser::prNotFound);
}

TEST(CfgParserTest, CommonParameterMustNotBeGivenForTheNode) {
  const std::string cfg = "CfgVer=1 port=com1 Node1::port=com2";
  ExpectRefused(cfg, "port", 1, CfgParser::cfgCommonOnly, CfgParser::prCantBePrefixed);
  ExpectFound(cfg, "port", -1, CfgParser::cfgCommonOnly, "com1");
}

TEST(CfgParserTest, NodeParameterMustNotBeGivenInCommon) {
  ExpectRefused("CfgVer=1 model=1 Node1::a=1", "model", -1, CfgParser::cfgNodeOnly,
                CfgParser::prCantBeNodeIndependent);
}

TEST(CfgParserTest, NodeParameterAskedForInCommonDependsOnTheNode) {
  ExpectRefused("CfgVer=1 Node1::model=1", "model", -1, CfgParser::cfgNodeOnly,
                CfgParser::prNodeDependent);
}

TEST(CfgParserTest, WithoutNodesANodeParameterIsAPlainLookUp) {
  ExpectFound("CfgVer=1 model=1", "model", -1, CfgParser::cfgNodeOnly, "1");
  ExpectRefused("CfgVer=1 port=1", "model", -1, CfgParser::cfgNodeOnly, CfgParser::prNotFound);
}

TEST(CfgParserTest, NodeParameterForANodeMayFallBack) {
  ExpectFound("CfgVer=1 model=1 Node1::a=1", "model", 1, CfgParser::cfgNodeOnly, "1");
}

TEST(CfgParserTest, ContradictingFlagsAreRefusedFirst) {
  const int both = CfgParser::cfgCommonOnly | CfgParser::cfgNodeOnly;
  ExpectRefused("CfgVer=1 model=1", "model", -1, both, CfgParser::prInvalidSpecification);
  ExpectRefused("CfgVer=1 Node1::model=1", "model", 1, both, CfgParser::prInvalidSpecification);
  ExpectRefused("CfgVer=1", "model", -1, both, CfgParser::prInvalidSpecification);
}
