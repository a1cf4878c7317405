// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <set>
#include <string>
#include <vector>

#include "driver/MemoryTypeCatalogue.h"

namespace {

constexpr int kTokenMax = 999999999;

struct ExpectedType {
  const char* name;
  int naturalCode;
  int vadoTypes;
  bool readOnly;
  bool writeOnly;
  int maxIndex;
  int blockReadCount;
  int blockWriteCount;
  const char* displayName;
  bool isSerialParam;
};

const std::vector<ExpectedType> kTypes = {
    {"tx_token", 2, 0x200, false, true, kTokenMax, kTokenMax, kTokenMax, "Token To Send", false},
    {"rx_token", 2, 0x200, true, false, kTokenMax, kTokenMax, 0, "Token Received", false},
    {"rx_token_len", 7, 0x40, true, false, 1, kTokenMax, 0, "Length of Token Received", false},
    {"tokens_available", 7, 0x40, true, false, 1, 0, 0, "Tokens Available", false},
    {"token_ack", 1, 0x1, false, true, 1, 0, 0, "Token Acknowledge", false},
    {"connect", 1, 0x1, false, false, 1, 0, 0, "Connect", false},
    {"SP_Baud", 7, 0x40, false, false, 1, 0, 0, "Serial Baudrate", true},
    {"SP_Bits", 5, 0x10, false, false, 1, 0, 0, "Serial Bits", true},
    {"SP_Stop", 5, 0x10, false, false, 1, 0, 0, "Serial Stop Bits", true},
    {"SP_Par", 5, 0x10, false, false, 1, 0, 0, "Serial Parity", true},
    {"SP_Mode", 5, 0x10, false, false, 1, 0, 0, "Serial Mode", true},
    {"SP_RxPrefix", 2, 0x200, false, false, 9999, 9999, 9999, "Rx Token Prefix", true},
    {"SP_RxSuffix", 2, 0x200, false, false, 9999, 9999, 9999, "Rx Token Suffix", true},
    {"SP_Gap", 7, 0x40, false, false, 1, 0, 0, "Token Gap", true},
    {"SP_TxPrefix", 2, 0x200, false, false, 9999, 9999, 9999, "Tx Token Prefix", true},
    {"SP_TxSuffix", 2, 0x200, false, false, 9999, 9999, 9999, "Tx Token Suffix", true},
    {"SP_HexTokens", 1, 0x1, false, false, 1, 0, 0, "Hexadecimal Tokens", true},
    {"SP_TokenQueueSize", 7, 0x40, false, false, 1, 0, 0, "Token Queue Size", true},
    {"SP_Done", 1, 0x1, false, false, 1, 0, 0, "Serial Done", true},
};

}  // namespace

TEST(MemoryTypeCatalogueTest, HasNineteenTypes) {
  EXPECT_EQ(kMemoryTypes.size(), 19U);
  EXPECT_EQ(kTypes.size(), 19U);
}

TEST(MemoryTypeCatalogueTest, RowsStandInTheirOrder) {
  for (std::size_t i = 0; i < kTypes.size(); ++i) {
    const MemoryTypeRow& row = kMemoryTypes[i];
    EXPECT_STREQ(row.name, kTypes[i].name);
    EXPECT_EQ(static_cast<std::size_t>(row.id), i) << row.name;
    EXPECT_EQ(row.naturalType, kTypes[i].naturalCode) << row.name;
    EXPECT_EQ(row.vadoTypes, kTypes[i].vadoTypes) << row.name;
    EXPECT_EQ(row.readOnly, kTypes[i].readOnly) << row.name;
    EXPECT_EQ(row.writeOnly, kTypes[i].writeOnly) << row.name;
    EXPECT_EQ(row.maxIndex, kTypes[i].maxIndex) << row.name;
    EXPECT_EQ(row.blockReadCount, kTypes[i].blockReadCount) << row.name;
    EXPECT_EQ(row.blockWriteCount, kTypes[i].blockWriteCount) << row.name;
    EXPECT_STREQ(row.displayName, kTypes[i].displayName) << row.name;
    EXPECT_EQ(row.isSerialParam, kTypes[i].isSerialParam) << row.name;
  }
}

TEST(MemoryTypeCatalogueTest, ModelHoldsEveryType) {
  const Model model = BuildModel();
  EXPECT_EQ(model.getName(), "1");
  for (const ExpectedType& expected : kTypes) {
    const MemoryType* const type = model.findMemoryType(expected.name);
    ASSERT_NE(type, nullptr) << expected.name;
    EXPECT_EQ(type->getName(), expected.name);
    EXPECT_EQ(type->getNaturalType(), expected.naturalCode) << expected.name;
    EXPECT_EQ(type->getVadoTypes(), expected.vadoTypes) << expected.name;
    EXPECT_EQ(type->isReadOnly(), expected.readOnly) << expected.name;
    EXPECT_EQ(type->isWriteOnly(), expected.writeOnly) << expected.name;
    EXPECT_EQ(type->getMaxIndex(), expected.maxIndex) << expected.name;
    EXPECT_EQ(type->getBlockReadCount(), expected.blockReadCount) << expected.name;
    EXPECT_EQ(type->getBlockWriteCount(), expected.blockWriteCount) << expected.name;
  }
}

TEST(MemoryTypeCatalogueTest, ModelHoldsNothingElse) {
  const Model model = BuildModel();
  for (const char* name : {"", "SP_baud", "TX_TOKEN", "tx_token ", "SP_", "1"}) {
    EXPECT_EQ(model.findMemoryType(name), nullptr) << name;
    EXPECT_EQ(FindMemoryType(name), nullptr) << name;
  }
}

TEST(MemoryTypeCatalogueTest, NamesAreDifferent) {
  std::set<std::string> names;
  for (const MemoryTypeRow& row : kMemoryTypes) names.insert(row.name);
  EXPECT_EQ(names.size(), 19U);
}

TEST(MemoryTypeCatalogueTest, FindsRowsByName) {
  for (const MemoryTypeRow& row : kMemoryTypes) EXPECT_EQ(FindMemoryType(row.name), &row);
}
