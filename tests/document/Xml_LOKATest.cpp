// SPDX-License-Identifier: Apache-2.0
// The description document says what the code does: every attribute is compared with the
// memory-type catalogue, the parameter defaults and the identity of the driver.
#include <gtest/gtest.h>
#include <zlib.h>

#include <cstring>
#include <map>
#include <pugixml.hpp>
#include <string>
#include <vector>

#include "driver/ConfigKeys.h"
#include "driver/MemoryTypeCatalogue.h"
#include "driver/ParamManager.h"
#include "driver/Protocol_LOKA.h"
#include "driver/SerialSettings.h"
#include "driver/Xml_LOKA.h"
#include "protlib/ProtUtilsN.h"

namespace {

using Attributes = std::vector<std::pair<std::string, std::string>>;

std::string Document() {
  const char* lengthLine = GetXml_LOKA();
  const std::string key = "compressedXML=";
  EXPECT_EQ(std::string(lengthLine).substr(0, key.size()), key);
  const unsigned long length = std::stoul(lengthLine + key.size());
  const char* stream = lengthLine + std::strlen(lengthLine) + 1;
  std::string text(1 << 16, '\0');
  auto textLength = static_cast<uLongf>(text.size());
  EXPECT_EQ(uncompress(reinterpret_cast<Bytef*>(text.data()), &textLength,
                       reinterpret_cast<const Bytef*>(stream), length),
            Z_OK);
  text.resize(textLength);
  return text;
}

std::string Word(bool value) { return value ? "true" : "false"; }

std::string HexMask(int mask) {
  char text[16];
  std::snprintf(text, sizeof text, "0x%x", static_cast<unsigned>(mask));
  return text;
}

Attributes AttributesOf(const pugi::xml_node& node) {
  Attributes attributes;
  for (const pugi::xml_attribute& attribute : node.attributes()) {
    attributes.emplace_back(attribute.name(), attribute.value());
  }
  return attributes;
}

// The text of an element as the document is laid out: two blanks a level, each child on a line of
// its own, but the first child directly behind the element's text when it has one. An element
// without anything in it is closed at once.
std::string Laid(const pugi::xml_node& node, const std::string& indent) {
  const std::string name = node.name();
  std::string out = "<" + name;
  for (const auto& attribute : AttributesOf(node)) {
    out += " " + attribute.first + "=\"" + attribute.second + "\"";
  }
  const bool isEmptyText = name == "compatibilityCode";
  if (!node.first_child() && !isEmptyText) return out + "/>";
  const std::string text = node.child_value();
  out += ">" + text;
  bool isBehindText = !text.empty();
  bool hasElements = false;
  for (const pugi::xml_node& child : node.children()) {
    if (child.type() != pugi::node_element) continue;
    if (!isBehindText) out += "\n" + indent + "  ";
    out += Laid(child, indent + "  ");
    isBehindText = false;
    hasElements = true;
  }
  if (hasElements) out += "\n" + indent;
  return out + "</" + name + ">";
}

std::vector<std::string> Entries(const pugi::xml_node& parameter) {
  std::vector<std::string> entries;
  for (const pugi::xml_node& entry : parameter.children("list_entry")) {
    entries.emplace_back(entry.child_value());
  }
  return entries;
}

class Xml_LOKATest : public ::testing::Test {
 protected:
  void SetUp() override {
    ASSERT_TRUE(document_.load_string(Document().c_str()));
    root_ = document_.child("protocol_cfg");
    ASSERT_TRUE(root_);
  }

  pugi::xml_node Parameter(const std::string& key) const {
    for (const pugi::xml_node& parameter : root_.child("parameters").children("parameter")) {
      if (key == parameter.child_value()) return parameter;
    }
    return {};
  }
  std::string Default(const std::string& key) const {
    return Parameter(key).attribute("default").value();
  }

  pugi::xml_document document_;
  pugi::xml_node root_;
};

TEST_F(Xml_LOKATest, SectionsInOrder) {
  std::string names;
  for (const pugi::xml_node& child : root_.children()) names += std::string(child.name()) + " ";
  EXPECT_EQ(names,
            "usesUart usesEthernet usesNetwork usesDatagram canWriteDatagram canMultipleRead "
            "canMultipleWrite usesTags isReentrant isConverted isProtgen usesTask usesSemaphore "
            "usesDoCommand usesExtend inheritsProtgen usesOfflineOpt name display "
            "compatibilityCode displayDlgTitle protGenVer code maxDisplayRows defaultOrt "
            "minimumOrt defaultRpt parameters memtypes tag_uri models conversions ");
}

TEST_F(Xml_LOKATest, IsLaidOutAsTheHostsToolWritesIt) {
  EXPECT_EQ(Document(), "<?xml version=\"1.0\" encoding=\"utf-8\"?>\n" + Laid(root_, "") + "\n");
}

TEST_F(Xml_LOKATest, FlagsAndIdentity) {
  Protocol_LOKA protocol;
  const std::map<std::string, std::string> expected = {
      {"usesUart", "true"},
      {"usesEthernet", "false"},
      {"usesNetwork", "false"},
      {"usesDatagram", Word(protocol.MaxDatagramItems(nullptr) != 0)},
      {"canWriteDatagram", Word(protocol.CanWriteDatagrams(nullptr))},
      {"canMultipleRead", Word(protocol.MultipleReadSupported())},
      {"canMultipleWrite", Word(protocol.MultipleWriteSupported())},
      {"usesTags", "false"},
      {"isReentrant", "true"},
      {"isConverted", Word(protocol.IsConverted())},
      {"isProtgen", "true"},
      {"usesTask", "true"},
      {"usesSemaphore", "true"},
      {"usesDoCommand", "true"},
      {"usesExtend", "true"},
      {"inheritsProtgen", "false"},
      {"usesOfflineOpt", "false"},
      {"name", protocol.GetName()},
      {"display", protocol.GetProtocolName()},
      {"compatibilityCode", ""},
      {"displayDlgTitle", protocol.GetProtocolName()},
      {"protGenVer", "213"},
      {"code", std::to_string(protocol.GetProtocolType())},
      {"maxDisplayRows", "14"},
      {"defaultOrt", "30000"},
      {"minimumOrt", "1000"},
      {"defaultRpt", "3"},
  };
  for (const auto& entry : expected) {
    EXPECT_EQ(root_.child(entry.first.c_str()).child_value(), entry.second) << entry.first;
  }
}

TEST_F(Xml_LOKATest, ParametersAreTheConfigurationKeysInOrder) {
  using namespace ConfigKeys;
  const std::vector<std::string> expected = {
      "CfgVer",  kModel,    kPort, kBaudrate, kParity,   kBits,      kStopbits,       kMode,
      kRxPrefix, kRxSuffix, kGap,  kTxPrefix, kTxSuffix, kHexTokens, kTokenQueueSize, kAutoConnect};
  std::vector<std::string> keys;
  for (const pugi::xml_node& parameter : root_.child("parameters").children()) {
    EXPECT_STREQ(parameter.name(), "parameter");
    keys.emplace_back(parameter.child_value());
  }
  EXPECT_EQ(keys, expected);
}

TEST_F(Xml_LOKATest, ParameterAttributes) {
  struct Row {
    const char* key;
    Attributes attributes;
  };
  const std::string queueSize = std::to_string(_LOKA::CommonParams::kDefaultTokenQueueSize);
  const std::string gap = std::to_string(_LOKA::CommonParams::kDefaultGapMs);
  const std::string hexTokens = Word(_LOKA::CommonParams::kDefaultHexTokens);
  const std::string autoConnect = Word(_LOKA::CommonParams::kDefaultAutoConnect);
  const auto plain = [](const char* display, const char* value, const char* node, const char* type,
                        const char* mandatory) {
    return Attributes{{"display", display},      {"default", value}, {"isNodeProperty", node},
                      {"group", "none"},         {"type", type},     {"isDistinct", "false"},
                      {"isMandatory", mandatory}};
  };
  const auto list = [](const char* display, const char* value, const char* listType) {
    return Attributes{{"display", display},        {"default", value},
                      {"isNodeProperty", "false"}, {"listType", listType},
                      {"group", "communications"}, {"type", "prop_list"},
                      {"isDistinct", "false"},     {"isMandatory", "true"}};
  };
  const auto optional = [](const char* display, const std::string& value, const char* type) {
    return Attributes{{"defaultValue", value},     {"display", display},    {"default", value},
                      {"isNodeProperty", "false"}, {"group", "none"},       {"type", type},
                      {"isDistinct", "false"},     {"isMandatory", "false"}};
  };
  const std::vector<Row> rows = {
      {"CfgVer", plain("none", "1", "false", "prop_integer", "true")},
      {"model", plain("Model", kModelName, "true", "prop_modelRef", "true")},
      {"port", list("Port", "com1", "prop_string")},
      {"baudrate", list("Baudrate", "9600", "prop_integer")},
      {"parity", list("Parity", "even", "prop_string")},
      {"bits", list("Data bits", "8", "prop_integer")},
      {"stopbits", list("Stop bits", "1", "prop_integer")},
      {"mode", list("Mode", "RS-232", "prop_string")},
      {"rx_prefix", optional("Rx Token Prefix", "", "prop_string")},
      {"rx_suffix", optional("Rx Token Suffix", "", "prop_string")},
      {"gap", optional("Token Gap", gap, "prop_integer")},
      {"tx_prefix", optional("Tx Token Prefix", "", "prop_string")},
      {"tx_suffix", optional("Tx Token Suffix", "", "prop_string")},
      {"hex_tokens", optional("Hexadecimal Tokens", hexTokens, "prop_bool")},
      {"token_queue_size",
       {{"defaultValue", queueSize},
        {"spin", "0"},
        {"display", "Token Queue Size"},
        {"default", queueSize},
        {"isNodeProperty", "false"},
        {"group", "none"},
        {"type", "prop_integer"},
        {"min", std::to_string(_LOKA::CommonParams::kSmallestTokenQueueSize)},
        {"max", std::to_string(_LOKA::CommonParams::kLargestTokenQueueSize)},
        {"isDistinct", "false"},
        {"isMandatory", "false"}}},
      {"autoConnect", optional("ConnectAtPowerUp", autoConnect, "prop_bool")},
  };
  for (const Row& row : rows) {
    EXPECT_EQ(AttributesOf(Parameter(row.key)), row.attributes) << row.key;
  }
}

TEST_F(Xml_LOKATest, OnlyListParametersHaveEntries) {
  for (const pugi::xml_node& parameter : root_.child("parameters").children()) {
    const bool isList = std::string(parameter.attribute("type").value()) == "prop_list";
    EXPECT_EQ(static_cast<bool>(parameter.child("list_entry")), isList) << parameter.child_value();
    for (const pugi::xml_node& child : parameter.children()) {
      if (child.type() != pugi::node_element) continue;
      EXPECT_STREQ(child.name(), "list_entry");
      EXPECT_FALSE(child.first_attribute());
    }
  }
}

// What the parser takes when an optional key is absent is what the document gives as its default.
TEST_F(Xml_LOKATest, OptionalDefaultsAreThoseOfTheParser) {
  _LOKA::ParamManager params;
  ASSERT_TRUE(params.parse(
      "CfgVer=1 model=1 port=com1 baudrate=9600 parity=even bits=8 stopbits=1 mode=RS-232"));
  const _LOKA::CommonParams& common = *params.getCommonParams();
  EXPECT_EQ(Default("rx_prefix"), common.rx_prefix);
  EXPECT_EQ(Default("rx_suffix"), common.rx_suffix);
  EXPECT_EQ(Default("gap"), std::to_string(common.gap));
  EXPECT_EQ(Default("tx_prefix"), common.tx_prefix);
  EXPECT_EQ(Default("tx_suffix"), common.tx_suffix);
  EXPECT_EQ(Default("hex_tokens"), Word(common.hex_tokens));
  EXPECT_EQ(Default("token_queue_size"), std::to_string(common.token_queue_size));
  EXPECT_EQ(Default("autoConnect"), Word(common.autoConnect));
}

TEST_F(Xml_LOKATest, ListsAreWhatTheDriverAccepts) {
  std::vector<std::string> ports;
  for (int i = 1; i <= 16; ++i) ports.push_back("com" + std::to_string(i));
  EXPECT_EQ(Entries(Parameter("port")), ports);
  EXPECT_EQ(Entries(Parameter("bits")), (std::vector<std::string>{"7", "8"}));
  EXPECT_EQ(Entries(Parameter("stopbits")), (std::vector<std::string>{"1", "2"}));
  EXPECT_EQ(Entries(Parameter("baudrate")),
            (std::vector<std::string>{"150", "300", "600", "1200", "2400", "4800", "9600", "19200",
                                      "38400", "57600", "115200"}));
  int listed = 0;
  for (const std::string& rate : Entries(Parameter("baudrate"))) {
    EXPECT_TRUE(IsListedBaudrate(std::stoi(rate))) << rate;
    ++listed;
  }
  for (int rate = 0; rate <= 200000; ++rate) listed -= IsListedBaudrate(rate) ? 1 : 0;
  EXPECT_EQ(listed, 0) << "the document and the driver list different baud rates";
  EXPECT_EQ(Entries(Parameter("parity")), (std::vector<std::string>{"none", "even", "odd"}));
  EXPECT_EQ(Entries(Parameter("mode")), (std::vector<std::string>{"RS-232", "RS-485", "RS-422"}));
  for (const std::string& word : Entries(Parameter("parity"))) EXPECT_TRUE(ParityFromConfig(word));
  for (const std::string& word : Entries(Parameter("mode"))) EXPECT_TRUE(ModeFromConfig(word));
  // The one word that the configuration takes and the document does not offer.
  EXPECT_TRUE(ParityFromConfig("mark"));
}

TEST_F(Xml_LOKATest, MemoryTypesAreTheCatalogue) {
  std::size_t index = 0;
  for (const pugi::xml_node& node : root_.child("memtypes").children()) {
    ASSERT_LT(index, kMemoryTypes.size());
    const MemoryTypeRow& row = kMemoryTypes[index++];
    // The document was shipped with another highest index for this one type; it stays so.
    const int maxIndex = row.id == MemoryTypeId::kRxTokenLen ? 999999999 : row.maxIndex;
    const Attributes expected = {
        {"canBitWrite", "false"},
        {"isSwap2", "false"},
        {"display", row.displayName},
        {"isSwap4", "false"},
        {"mustBitRead", "false"},
        {"blockReadCount", std::to_string(row.blockReadCount)},
        {"blockWriteCount", std::to_string(row.blockWriteCount)},
        {"vadoTypes", HexMask(row.vadoTypes)},
        {"naturalType", ProtUtilsN::GetVADOName(row.naturalType, 0)},
        {"isSwap8", "false"},
        {"hasInternalConversion", "false"},
        {"useInDatagram", "false"},
        {"canBitArrayWrite", "false"},
        {"min", "0"},
        {"max", std::to_string(maxIndex)},
        {"isReadOnly", Word(row.readOnly)},
        {"isWriteOnly", Word(row.writeOnly)},
    };
    EXPECT_STREQ(node.name(), "memtype");
    EXPECT_STREQ(node.child_value(), row.name);
    EXPECT_EQ(AttributesOf(node), expected) << row.name;
  }
  EXPECT_EQ(index, kMemoryTypes.size());
}

TEST_F(Xml_LOKATest, TagUriFields) {
  const auto field = [](const char* display, const char* value, const char* type, const char* sub,
                        const char* mandatory) {
    return Attributes{{"display", display},
                      {"default", value},
                      {"arrayType", "false"},
                      {"readonly", "true"},
                      {"group", "field"},
                      {"type", type},
                      {"sub", sub},
                      {"conversion", "true"},
                      {"ExcludeOnlyIf", "false"},
                      {"mandatory", mandatory}};
  };
  std::vector<Attributes> expected = {
      field("node", "", "prop_nodeRef", "false", "false"),
      field("Memory Type", "", "prop_memRef", "false", "true"),
      field("Data Type", "boolean", "prop_vadoType", "true", "true")};
  expected[0].insert(expected[0].begin(), {"defaultValue", ""});
  Protocol_LOKA protocol;
  int index = 0;
  for (const pugi::xml_node& node : root_.child("tag_uri").children("tag_field")) {
    EXPECT_STREQ(node.child_value(), protocol.getTagUriFieldName(index));
    EXPECT_EQ(AttributesOf(node), expected[static_cast<std::size_t>(index)]);
    ++index;
  }
  EXPECT_EQ(index, protocol.getTagUriFieldCount());
}

TEST_F(Xml_LOKATest, TheModelListsEveryMemoryTypeWithConnectLast) {
  const pugi::xml_node models = root_.child("models");
  const pugi::xml_node model = models.child("model");
  EXPECT_FALSE(model.next_sibling());
  EXPECT_STREQ(model.child_value(), kModelName);
  EXPECT_EQ(AttributesOf(model),
            (Attributes{{"display", "default"}, {"datagramCount", "0"}, {"datagramLength", "0"}}));
  std::vector<std::string> names;
  for (const pugi::xml_node& node : model.children("memtype_ref")) {
    const MemoryTypeRow* row = FindMemoryType(node.child_value());
    ASSERT_NE(row, nullptr) << node.child_value();
    EXPECT_EQ(AttributesOf(node),
              (Attributes{{"min", "0"}, {"max", std::to_string(row->maxIndex)}}));
    names.emplace_back(row->name);
  }
  std::vector<std::string> expected;
  for (const MemoryTypeRow& row : kMemoryTypes) {
    if (row.id != MemoryTypeId::kConnect) expected.emplace_back(row.name);
  }
  expected.emplace_back("connect");
  EXPECT_EQ(names, expected);
}

TEST_F(Xml_LOKATest, NoConversionsOfItsOwn) {
  const pugi::xml_node conversions = root_.child("conversions");
  EXPECT_EQ(AttributesOf(conversions), (Attributes{{"display", "Conversions"}}));
  EXPECT_FALSE(conversions.first_child());
}

}  // namespace
