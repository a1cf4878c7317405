// SPDX-License-Identifier: Apache-2.0
#pragma once

// Keys of the run-time serial settings, in the stores and in permanent storage. A change would lose
// the overrides of every panel in the field.
namespace ParameterNames {

inline constexpr const char* kBaud = "baud";
inline constexpr const char* kParity = "parity";
inline constexpr const char* kBits = "bits";
inline constexpr const char* kStop = "stop";
inline constexpr const char* kMode = "mode";
inline constexpr const char* kRxPrefix = "rx_prefix";
inline constexpr const char* kRxSuffix = "rx_suffix";
inline constexpr const char* kTxPrefix = "tx_prefix";
inline constexpr const char* kTxSuffix = "tx_suffix";
inline constexpr const char* kGap = "gap";
inline constexpr const char* kHexTokens = "hex_tokens";
inline constexpr const char* kTokenQueueSize = "token_queue_size";

}  // namespace ParameterNames
