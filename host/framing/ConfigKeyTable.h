// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <string_view>
#include <vector>

// A key of the driver's configuration text as the host knows it without a plug-in. A test holds the
// table to the description document.
struct ConfigKey {
  enum class Kind { kText, kNumber, kHexText, kBoolean };

  std::string_view key;
  Kind kind = Kind::kText;
  bool isMandatory = false;
  std::string_view defaultText;
  std::vector<std::string_view> entries;  // what the document offers; empty: see kind and limits
  std::string_view alsoAccepted;          // what the driver takes beyond them; empty: nothing
  std::string_view meaning;

  // What may be written, for people: "7, 8", "1 to 10000", "hexadecimal text or none".
  std::string AllowedText() const;
};

constexpr int kMinQueueTokens = 1;
constexpr int kMaxQueueTokens = 10000;

// All keys in the document's order. Any thread.
const std::vector<ConfigKey>& ConfigKeys();

// Null for a key that is not there. Any thread.
const ConfigKey* FindConfigKey(std::string_view key);
