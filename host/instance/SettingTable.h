// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <string>

#include "host/store/StoredValue.h"

// The twelve settings that can change while the driver runs, under all their names: the key in the
// permanent storage and on our command line, the key in the configuration text, the memory type of
// the tag that stages it. The only place in the host that lists them.

enum class SettingForm { kNumber, kParity, kMode, kHexText, kBoolean };

struct SettingEntry {
  const char* key;         // "baud"
  const char* configKey;   // "baudrate"
  const char* fallback;    // what the configuration means without the key
  const char* memoryType;  // "SP_Baud"
  const char* tagType;     // "unsignedInt"
  SettingForm form;
};

inline constexpr std::array<SettingEntry, 12> kSettingTable = {{
    {"baud", "baudrate", "0", "SP_Baud", "unsignedInt", SettingForm::kNumber},
    {"parity", "parity", "none", "SP_Par", "unsignedByte", SettingForm::kParity},
    {"bits", "bits", "0", "SP_Bits", "unsignedByte", SettingForm::kNumber},
    {"stop", "stopbits", "0", "SP_Stop", "unsignedByte", SettingForm::kNumber},
    {"mode", "mode", "RS-232", "SP_Mode", "unsignedByte", SettingForm::kMode},
    {"rx_prefix", "rx_prefix", "", "SP_RxPrefix", "string-4096", SettingForm::kHexText},
    {"rx_suffix", "rx_suffix", "", "SP_RxSuffix", "string-4096", SettingForm::kHexText},
    {"tx_prefix", "tx_prefix", "", "SP_TxPrefix", "string-4096", SettingForm::kHexText},
    {"tx_suffix", "tx_suffix", "", "SP_TxSuffix", "string-4096", SettingForm::kHexText},
    {"gap", "gap", "0", "SP_Gap", "unsignedInt", SettingForm::kNumber},
    {"hex_tokens", "hex_tokens", "false", "SP_HexTokens", "boolean", SettingForm::kBoolean},
    {"token_queue_size", "token_queue_size", "100", "SP_TokenQueueSize", "unsignedInt",
     SettingForm::kNumber},
}};

// All functions: any thread.

// By its key or its configuration key; null when there is none.
const SettingEntry* FindSetting(const std::string& name);

// By its memory type; null when there is none.
const SettingEntry* FindSettingOfMemoryType(const std::string& memoryType);

// "0?SP_Baud?unsignedInt".
std::string TagUri(const SettingEntry& setting);

// A tag's value as people write it: "even" for 1, "none" for the empty prefix, "true" for 1.
std::string ShowSetting(const SettingEntry& setting, const std::string& tagValue);

// The same for a value of the permanent storage.
std::string ShowStored(const SettingEntry& setting, const StoredValue& value);

// The same for a value of the configuration text.
std::string ShowConfigured(const SettingEntry& setting, const std::string& configValue);

// The other way round: what to write to the tag for a value that a person wrote. False, with the
// values that are allowed in `error`, when there is no such value. The driver refuses some values
// without a text, so this says it in its place.
bool ParseSetting(const SettingEntry& setting, const std::string& value, std::string* tagValue,
                  std::string* error);

// What the driver takes, for messages: "7 or 8".
std::string AllowedValues(const SettingEntry& setting);

// The keys of all settings, for messages: "baud, parity, ...".
std::string SettingNames();
