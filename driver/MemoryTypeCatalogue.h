// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <cstddef>
#include <string>

#include "interfaces/ICU_Type.h"
#include "model/Model.h"

// The driver's memory types: everything that a tag can name. The only place where their names and
// attributes stand.

enum class MemoryTypeId {
  kTxToken,
  kRxToken,
  kRxTokenLen,
  kTokensAvailable,
  kTokenAck,
  kConnect,
  kBaud,
  kBits,
  kStop,
  kParity,
  kMode,
  kRxPrefix,
  kRxSuffix,
  kGap,
  kTxPrefix,
  kTxSuffix,
  kHexTokens,
  kTokenQueueSize,
  kDone,
};

struct MemoryTypeRow {
  MemoryTypeId id;
  const char* name;
  ICU_Type naturalType;
  int vadoTypes;  // mask of the data types that a tag may use
  bool readOnly;
  bool writeOnly;
  int maxIndex;
  int blockReadCount;
  int blockWriteCount;
  bool isSerialParam;  // one of the run-time serial settings
  const char* displayName;
};

inline constexpr std::size_t kMemoryTypeCount = 19;

// In the order in which they are added to the model; the row of an id stands at its number.
extern const std::array<MemoryTypeRow, kMemoryTypeCount> kMemoryTypes;

// Name of the driver's one model.
inline constexpr const char* kModelName = "1";

// The model with all memory types, without datagram support.
Model BuildModel();

// The row of that exact name, or null.
const MemoryTypeRow* FindMemoryType(const std::string& name);
