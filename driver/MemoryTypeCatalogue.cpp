// SPDX-License-Identifier: Apache-2.0
#include "driver/MemoryTypeCatalogue.h"

#include <algorithm>

namespace {

using Id = MemoryTypeId;

constexpr int kBoolean = 0x1;
constexpr int kUnsignedByte = 0x10;
constexpr int kUnsignedInt = 0x40;
constexpr int kString = 0x200;

constexpr int kTokenSpan = 999999999;
constexpr int kFramingSpan = 9999;

MemoryType FromRow(const MemoryTypeRow& row) {
  MemoryType type;
  type.setName(row.name);
  type.setNaturalType(row.naturalType);
  type.setVadoTypes(row.vadoTypes);
  type.setReadOnly(row.readOnly);
  type.setWriteOnly(row.writeOnly);
  type.setMinIndex(0);
  type.setMaxIndex(row.maxIndex);
  type.setBlockReadCount(row.blockReadCount);
  type.setBlockWriteCount(row.blockWriteCount);
  return type;
}

}  // namespace

// Columns: id, name, natural type, data types, read-only, write-only, highest index, block read and
// write count, serial setting, display name.
// clang-format off
const std::array<MemoryTypeRow, kMemoryTypeCount> kMemoryTypes = {{
    {Id::kTxToken, "tx_token", ICU_BYTE, kString, false, true, kTokenSpan, kTokenSpan, kTokenSpan, false, "Token To Send"},
    {Id::kRxToken, "rx_token", ICU_BYTE, kString, true, false, kTokenSpan, kTokenSpan, 0, false, "Token Received"},
    {Id::kRxTokenLen, "rx_token_len", ICU_UNSIGNED_INT, kUnsignedInt, true, false, 1, kTokenSpan, 0, false, "Length of Token Received"},
    {Id::kTokensAvailable, "tokens_available", ICU_UNSIGNED_INT, kUnsignedInt, true, false, 1, 0, 0, false, "Tokens Available"},
    {Id::kTokenAck, "token_ack", ICU_BOOLEAN, kBoolean, false, true, 1, 0, 0, false, "Token Acknowledge"},
    {Id::kConnect, "connect", ICU_BOOLEAN, kBoolean, false, false, 1, 0, 0, false, "Connect"},
    {Id::kBaud, "SP_Baud", ICU_UNSIGNED_INT, kUnsignedInt, false, false, 1, 0, 0, true, "Serial Baudrate"},
    {Id::kBits, "SP_Bits", ICU_UNSIGNED_BYTE, kUnsignedByte, false, false, 1, 0, 0, true, "Serial Bits"},
    {Id::kStop, "SP_Stop", ICU_UNSIGNED_BYTE, kUnsignedByte, false, false, 1, 0, 0, true, "Serial Stop Bits"},
    {Id::kParity, "SP_Par", ICU_UNSIGNED_BYTE, kUnsignedByte, false, false, 1, 0, 0, true, "Serial Parity"},
    {Id::kMode, "SP_Mode", ICU_UNSIGNED_BYTE, kUnsignedByte, false, false, 1, 0, 0, true, "Serial Mode"},
    {Id::kRxPrefix, "SP_RxPrefix", ICU_BYTE, kString, false, false, kFramingSpan, kFramingSpan, kFramingSpan, true, "Rx Token Prefix"},
    {Id::kRxSuffix, "SP_RxSuffix", ICU_BYTE, kString, false, false, kFramingSpan, kFramingSpan, kFramingSpan, true, "Rx Token Suffix"},
    {Id::kGap, "SP_Gap", ICU_UNSIGNED_INT, kUnsignedInt, false, false, 1, 0, 0, true, "Token Gap"},
    {Id::kTxPrefix, "SP_TxPrefix", ICU_BYTE, kString, false, false, kFramingSpan, kFramingSpan, kFramingSpan, true, "Tx Token Prefix"},
    {Id::kTxSuffix, "SP_TxSuffix", ICU_BYTE, kString, false, false, kFramingSpan, kFramingSpan, kFramingSpan, true, "Tx Token Suffix"},
    {Id::kHexTokens, "SP_HexTokens", ICU_BOOLEAN, kBoolean, false, false, 1, 0, 0, true, "Hexadecimal Tokens"},
    {Id::kTokenQueueSize, "SP_TokenQueueSize", ICU_UNSIGNED_INT, kUnsignedInt, false, false, 1, 0, 0, true, "Token Queue Size"},
    {Id::kDone, "SP_Done", ICU_BOOLEAN, kBoolean, false, false, 1, 0, 0, true, "Serial Done"},
}};
// clang-format on

Model BuildModel() {
  Model model(kModelName);
  for (const MemoryTypeRow& row : kMemoryTypes) {
    model.addMemoryType(FromRow(row));
  }
  return model;
}

const MemoryTypeRow* FindMemoryType(const std::string& name) {
  const auto* row =
      std::find_if(kMemoryTypes.begin(), kMemoryTypes.end(),
                   [&name](const MemoryTypeRow& entry) { return name == entry.name; });
  return row == kMemoryTypes.end() ? nullptr : row;
}
