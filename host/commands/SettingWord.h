// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include "host/instance/SettingTable.h"
#include "host/store/StoredValue.h"

// A setting as people write it on the command line.
struct SettingWord {
  const SettingEntry* entry = nullptr;
  std::string tagValue;  // for the tag of the setting
};

// Reads "baud=19200", "parity=even", "rx_suffix=CR LF". Prefixes and suffixes may be written with
// the names of ControlNames. False, with the keys or the values that there are in `error`, for
// anything else. Any thread.
bool ParseSettingWord(const std::string& word, SettingWord* setting, std::string* error);

// The value as the driver's storage keeps it: a number, a boolean or a text. Any thread.
StoredValue StoredValueOf(const SettingWord& setting);
