// SPDX-License-Identifier: Apache-2.0
#pragma once

// The keys of the configuration text. Values and defaults: CommonParams.
namespace ConfigKeys {

inline constexpr const char* kModel = "model";
inline constexpr const char* kPort = "port";
inline constexpr const char* kBaudrate = "baudrate";
inline constexpr const char* kParity = "parity";
inline constexpr const char* kBits = "bits";
inline constexpr const char* kStopbits = "stopbits";
inline constexpr const char* kMode = "mode";
inline constexpr const char* kRxPrefix = "rx_prefix";
inline constexpr const char* kRxSuffix = "rx_suffix";
inline constexpr const char* kGap = "gap";
inline constexpr const char* kTxPrefix = "tx_prefix";
inline constexpr const char* kTxSuffix = "tx_suffix";
inline constexpr const char* kHexTokens = "hex_tokens";
inline constexpr const char* kTokenQueueSize = "token_queue_size";
inline constexpr const char* kAutoConnect = "autoConnect";

}  // namespace ConfigKeys
