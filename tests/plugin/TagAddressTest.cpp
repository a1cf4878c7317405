// SPDX-License-Identifier: Apache-2.0
// Tag URIs: node, memory type, data type, and what a tag then says of itself.
#include "tests/plugin/PluginFixture.h"

namespace {

class TagAddressTest : public ProtocolFixture {
 protected:
  void SetUp() override {
    ProtocolFixture::SetUp();
    ASSERT_TRUE(P().Config(Mandatory("Node1::model=1 Node7::model=nosuch")));
  }
  // The tag's error text behind its name, or "valid".
  std::string Check(const std::string& uri) {
    if (P().Tag(uri) != nullptr) return "valid";
    const std::string head = "-1 Tag URI error: " + uri + " - ";
    const std::string error = P().Error();
    return error.compare(0, head.size(), head) == 0 ? error.substr(head.size()) : error;
  }
};

TEST_F(TagAddressTest, NumberOfFields) {
  const std::string expected = "there must be 3 tag specification fields";
  for (const char* uri : {"", "0", "0?tx_token", "0?tx_token?string-10?x", "????", "a b c"}) {
    EXPECT_EQ(Check(uri), expected) << uri;
  }
}

TEST_F(TagAddressTest, MissingFields) {
  EXPECT_EQ(Check("0??boolean"), "memorytype field missing");
  EXPECT_EQ(Check("0? \t ?boolean"), "memorytype field missing");
  EXPECT_EQ(Check("??"), "memorytype field missing");
  EXPECT_EQ(Check("0?connect?"), "vadoType field missing");
  EXPECT_EQ(Check("0?connect? "), "vadoType field missing");
  EXPECT_EQ(Check("0?nosuch?"), "vadoType field missing");
}

TEST_F(TagAddressTest, UnknownMemoryTypes) {
  for (const char* name : {"Connect", "CONNECT", "connec", "connect2", "tx token", "SP_done",
                           "rx_token_length", "SP_Space"}) {
    EXPECT_EQ(Check(std::string("0?") + name + "?boolean"), "Can't access memory type") << name;
  }
  // The memory type is looked at before the data type.
  EXPECT_EQ(Check("0?nosuch?nosuch"), "Can't access memory type");
}

TEST_F(TagAddressTest, AModelThatIsNotThereHasNoMemoryTypes) {
  EXPECT_EQ(Check("7?connect?boolean"), "Can't access memory type");
  EXPECT_EQ(Check("1?connect?boolean"), "valid");
  EXPECT_EQ(Check("8?connect?boolean"), "valid");
  ProtocolUnderTest other(plugin_);
  ASSERT_TRUE(other.Config(
      "CfgVer=1 model=2 port=com1 baudrate=1 parity=none bits=8 stopbits=1 mode=RS-232"));
  EXPECT_EQ(other.Tag("0?connect?boolean"), nullptr);
  EXPECT_EQ(other.Error(), "-1 Tag URI error: 0?connect?boolean - Can't access memory type");
}

TEST_F(TagAddressTest, NoTagsBeforeConfig) {
  ProtocolUnderTest other(plugin_);
  EXPECT_EQ(other.Tag("0?connect?boolean"), nullptr);
  EXPECT_EQ(other.Error(), "-1 Tag URI error: 0?connect?boolean - Can't access memory type");
}

TEST_F(TagAddressTest, UnknownDataTypes) {
  for (const char* type : {"strin-10", "Boolean", "bool", "string", "stringx-1", "int(x", "(",
                           "unsignedInt(", "boolean)(", "-", "-5", "unsignedInt)(swap2"}) {
    EXPECT_EQ(Check(std::string("0?connect?") + type), std::string(type) + ": data type unknown");
  }
  // The text is the trimmed field.
  EXPECT_EQ(Check("0?connect? strin-10 "), "strin-10: data type unknown");
}

// Every memory type takes exactly one of the 27 data types.
TEST_F(TagAddressTest, AllowedDataTypes) {
  const char* types[] = {
      "boolean",       "byte",    "short",    "int",      "unsignedByte",   "unsignedShort",
      "unsignedInt",   "float",   "double",   "string-4", "binary-4",       "time",
      "boolean-4",     "byte-4",  "short-4",  "int-4",    "unsignedByte-4", "unsignedShort-4",
      "unsignedInt-4", "float-4", "double-4", "time-4",   "uint64",         "int64",
      "uint64-4",      "int64-4", "object"};
  const struct {
    const char* memoryType;
    const char* dataType;
  } rows[] = {{"tx_token", "string-4"},        {"rx_token", "string-4"},
              {"rx_token_len", "unsignedInt"}, {"tokens_available", "unsignedInt"},
              {"token_ack", "boolean"},        {"connect", "boolean"},
              {"SP_Baud", "unsignedInt"},      {"SP_Bits", "unsignedByte"},
              {"SP_Stop", "unsignedByte"},     {"SP_Par", "unsignedByte"},
              {"SP_Mode", "unsignedByte"},     {"SP_RxPrefix", "string-4"},
              {"SP_RxSuffix", "string-4"},     {"SP_Gap", "unsignedInt"},
              {"SP_TxPrefix", "string-4"},     {"SP_TxSuffix", "string-4"},
              {"SP_HexTokens", "boolean"},     {"SP_TokenQueueSize", "unsignedInt"},
              {"SP_Done", "boolean"}};
  for (const auto& row : rows) {
    int allowed = 0;
    for (const char* type : types) {
      const std::string result = Check(std::string("0?") + row.memoryType + "?" + type);
      const bool isTheOne = std::string(type) == row.dataType;
      EXPECT_EQ(result, isTheOne ? "valid" : "not allowed vado type")
          << row.memoryType << " " << type;
      allowed += result == "valid" ? 1 : 0;
    }
    EXPECT_EQ(allowed, 1) << row.memoryType;
  }
}

TEST_F(TagAddressTest, AccessRights) {
  const struct {
    const char* uri;
    bool readOnly;
    bool writeOnly;
  } rows[] = {{"0?tx_token?string-4", false, true},
              {"0?rx_token?string-4", true, false},
              {"0?rx_token_len?unsignedInt", true, false},
              {"0?tokens_available?unsignedInt", true, false},
              {"0?token_ack?boolean", false, true},
              {"0?connect?boolean", false, false},
              {"0?SP_Baud?unsignedInt", false, false},
              {"0?SP_Bits?unsignedByte", false, false},
              {"0?SP_Stop?unsignedByte", false, false},
              {"0?SP_Par?unsignedByte", false, false},
              {"0?SP_Mode?unsignedByte", false, false},
              {"0?SP_RxPrefix?string-4", false, false},
              {"0?SP_RxSuffix?string-4", false, false},
              {"0?SP_Gap?unsignedInt", false, false},
              {"0?SP_TxPrefix?string-4", false, false},
              {"0?SP_TxSuffix?string-4", false, false},
              {"0?SP_HexTokens?boolean", false, false},
              {"0?SP_TokenQueueSize?unsignedInt", false, false},
              {"0?SP_Done?boolean", false, false}};
  for (const auto& row : rows) {
    const ITag* tag = P().Tag(row.uri);
    ASSERT_NE(tag, nullptr) << row.uri;
    EXPECT_EQ(tag->IsReadOnly(), row.readOnly) << row.uri;
    EXPECT_EQ(tag->IsWriteOnly(), row.writeOnly) << row.uri;
    EXPECT_EQ(tag->GetByteOffset(), 0U) << row.uri;
    EXPECT_EQ(tag->GetBitIndex(), 0) << row.uri;
    EXPECT_STREQ(tag->GetVarName(), row.uri);
  }
}

TEST_F(TagAddressTest, TypesAndLengths) {
  const struct {
    const char* uri;
    ICU_Type type;
    int length;
    ICU_Type itemType;
    int packed;
  } rows[] = {
      {"0?tx_token?string-100", ICU_STRING, 100, ICU_BYTE, 100},
      {"0?tx_token?string-0", ICU_STRING, 0, ICU_BYTE, 0},
      {"0?tx_token?string-", ICU_STRING, 0, ICU_BYTE, 0},
      {"0?tx_token?string-x", ICU_STRING, 0, ICU_BYTE, 0},
      {"0?tx_token?string- 5", ICU_STRING, 0, ICU_BYTE, 0},
      {"0?tx_token?string--5", ICU_STRING, 0, ICU_BYTE, 0},
      {"0?tx_token?string-+5", ICU_STRING, 0, ICU_BYTE, 0},
      {"0?tx_token?string-12ab", ICU_STRING, 12, ICU_BYTE, 12},
      {"0?tx_token?string-010", ICU_STRING, 10, ICU_BYTE, 10},
      {"0?tx_token?string-2147483647", ICU_STRING, 2147483647, ICU_BYTE, 2147483647},
      {"0?tx_token?string-2147483648", ICU_STRING, 2147483647, ICU_BYTE, 2147483647},
      {"0?tx_token?string-99999999999999999999", ICU_STRING, 2147483647, ICU_BYTE, 2147483647},
      {"0?connect?boolean", ICU_BOOLEAN, 1, ICU_NONE, 1},
      {"0?SP_Baud?unsignedInt", ICU_UNSIGNED_INT, 4, ICU_NONE, 4},
      {"0?SP_Par?unsignedByte", ICU_UNSIGNED_BYTE, 1, ICU_NONE, 1},
      {" 0 ? tx_token ? string-7 ", ICU_STRING, 7, ICU_BYTE, 7},
      {"\t0\t?\ttx_token\t?\tstring-7\t", ICU_STRING, 7, ICU_BYTE, 7},
      {"0?tx_token?string-7(swap2)", ICU_STRING, 7, ICU_BYTE, 7},
      {"0?tx_token?string-7 (swap2)", ICU_STRING, 7, ICU_BYTE, 7},
      {"0?tx_token?string-7(swap2)and more", ICU_STRING, 7, ICU_BYTE, 7},
      {"0?tx_token?string-7()", ICU_STRING, 7, ICU_BYTE, 7},
      {"0?SP_Baud?unsignedInt(no such conversion)", ICU_UNSIGNED_INT, 4, ICU_NONE, 4}};
  for (const auto& row : rows) {
    const ITag* tag = P().Tag(row.uri);
    ASSERT_NE(tag, nullptr) << row.uri << ": " << P().Error();
    EXPECT_EQ(tag->GetVarType(), row.type) << row.uri;
    EXPECT_EQ(tag->GetVarLength(), row.length) << row.uri;
    EXPECT_EQ(tag->GetItemType(), row.itemType) << row.uri;
    EXPECT_EQ(tag->PackedLen(), row.packed) << row.uri;
  }
}

TEST_F(TagAddressTest, NodeNumbers) {
  const struct {
    const char* node;
    int number;
  } rows[] = {{"0", 0},
              {"", 0},
              {"  ", 0},
              {"text", 0},
              {"5", 5},
              {"0x1", 1},
              {"0x1F", 31},
              {"010", 8},
              {"08", 0},
              {"12abc", 12},
              {"-5", -5},
              {"+5", 5},
              {"2147483647", 2147483647},
              {"2147483648", 2147483647},
              {"99999999999999999999", 2147483647},
              {"-99999999999999999999", -2147483647 - 1}};
  for (const auto& row : rows) {
    const ITag* tag = P().Tag(std::string(row.node) + "?connect?boolean");
    ASSERT_NE(tag, nullptr) << row.node;
    EXPECT_EQ(P()->GetNodeID(tag), row.number) << row.node;
  }
}

// The memory type "SP_..." of the serial settings and "connect" take different ways; see the read
// and write tests. Here: the same address twice gives two tags.
TEST_F(TagAddressTest, TheSameAddressTwice) {
  const ITag* first = P().Tag("0?connect?boolean");
  const ITag* second = P().Tag("0?connect?boolean");
  ASSERT_NE(first, nullptr);
  ASSERT_NE(second, nullptr);
  EXPECT_NE(first, second);
}

}  // namespace
