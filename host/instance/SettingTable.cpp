// SPDX-License-Identifier: Apache-2.0
#include "host/instance/SettingTable.h"

#include <algorithm>
#include <cctype>
#include <cstdint>
#include <cstdlib>
#include <optional>

namespace {

constexpr std::array<const char*, 5> kParityNames = {"none", "even", "odd", "mark", "space"};
constexpr std::array<const char*, 3> kModeNames = {"RS-232", "RS-485", "RS-422"};
constexpr std::array<const char*, 11> kBaudrates = {
    "150", "300", "600", "1200", "2400", "4800", "9600", "19200", "38400", "57600", "115200"};
constexpr std::array<const char*, 2> kDataBits = {"7", "8"};
constexpr std::array<const char*, 2> kStopBits = {"1", "2"};
constexpr const char* kNoBytes = "none";

template <std::size_t count>
std::string Join(const std::array<const char*, count>& words) {
  std::string text;
  for (std::size_t i = 0; i < count; ++i) {
    if (i > 0) {
      text += i + 1 == count ? " or " : ", ";
    }
    text += words[i];
  }
  return text;
}

template <std::size_t count>
std::optional<std::size_t> IndexOf(const std::array<const char*, count>& words,
                                   const std::string& word) {
  for (std::size_t i = 0; i < count; ++i) {
    if (words[i] == word) {
      return i;
    }
  }
  return std::nullopt;
}

template <std::size_t count>
std::string NameOf(const std::array<const char*, count>& names, const std::string& code) {
  const unsigned long index = std::strtoul(code.c_str(), nullptr, 10);
  return index < count ? names[index] : code;
}

bool IsNumber(const std::string& text) {
  return !text.empty() && text.size() <= 10 &&
         std::all_of(text.begin(), text.end(),
                     [](unsigned char c) { return std::isdigit(c) != 0; });
}

// Hexadecimal text in one spelling: upper case, and "none" for no bytes.
std::string NormalHexText(const std::string& text) {
  if (text.empty() || text == kNoBytes) {
    return kNoBytes;
  }
  std::string result = text;
  std::transform(result.begin(), result.end(), result.begin(),
                 [](unsigned char c) { return static_cast<char>(std::toupper(c)); });
  return result;
}

bool IsHexText(const std::string& text) {
  return text.size() % 2 == 0 && std::all_of(text.begin(), text.end(),
                                             [](unsigned char c) { return std::isxdigit(c) != 0; });
}

bool IsIn(const SettingEntry& setting, const char* memoryType) {
  return std::string(setting.memoryType) == memoryType;
}

// The tag value for a number, or nothing when the driver would refuse it.
std::optional<std::string> ParseNumber(const SettingEntry& setting, const std::string& value) {
  bool isGood = IsNumber(value);
  if (IsIn(setting, "SP_Baud")) {
    isGood = IndexOf(kBaudrates, value).has_value();
  } else if (IsIn(setting, "SP_Bits")) {
    isGood = IndexOf(kDataBits, value).has_value();
  } else if (IsIn(setting, "SP_Stop")) {
    isGood = IndexOf(kStopBits, value).has_value();
  } else {
    isGood = isGood && std::strtoull(value.c_str(), nullptr, 10) <= INT32_MAX;
  }
  return isGood ? std::optional<std::string>(value) : std::nullopt;
}

std::optional<std::string> ParseBoolean(const std::string& value) {
  if (value == "1" || value == "true" || value == "on") {
    return "1";
  }
  if (value == "0" || value == "false" || value == "off") {
    return "0";
  }
  return std::nullopt;
}

template <std::size_t count>
std::optional<std::string> ParseName(const std::array<const char*, count>& names,
                                     const std::string& value) {
  const auto index = IndexOf(names, value);
  if (index) {
    return std::to_string(*index);
  }
  const bool isCode = IsNumber(value) && std::strtoul(value.c_str(), nullptr, 10) < count;
  return isCode ? std::optional<std::string>(value) : std::nullopt;
}

std::optional<std::string> Parse(const SettingEntry& setting, const std::string& value) {
  switch (setting.form) {
    case SettingForm::kNumber:
      return ParseNumber(setting, value);
    case SettingForm::kParity:
      return ParseName(kParityNames, value);
    case SettingForm::kMode:
      return ParseName(kModeNames, value);
    case SettingForm::kBoolean:
      return ParseBoolean(value);
    case SettingForm::kHexText:
      break;
  }
  return value == kNoBytes || IsHexText(value) ? std::optional<std::string>(value) : std::nullopt;
}

}  // namespace

const SettingEntry* FindSetting(const std::string& name) {
  const auto* const found = std::find_if(
      kSettingTable.begin(), kSettingTable.end(),
      [&](const SettingEntry& entry) { return name == entry.key || name == entry.configKey; });
  return found == kSettingTable.end() ? nullptr : found;
}

const SettingEntry* FindSettingOfMemoryType(const std::string& memoryType) {
  const auto* const found =
      std::find_if(kSettingTable.begin(), kSettingTable.end(),
                   [&](const SettingEntry& entry) { return memoryType == entry.memoryType; });
  return found == kSettingTable.end() ? nullptr : found;
}

std::string TagUri(const SettingEntry& setting) {
  return std::string("0?") + setting.memoryType + "?" + setting.tagType;
}

std::string ShowSetting(const SettingEntry& setting, const std::string& tagValue) {
  switch (setting.form) {
    case SettingForm::kParity:
      return NameOf(kParityNames, tagValue);
    case SettingForm::kMode:
      return NameOf(kModeNames, tagValue);
    case SettingForm::kBoolean:
      return tagValue == "0" ? "false" : "true";
    case SettingForm::kHexText:
      return NormalHexText(tagValue);
    case SettingForm::kNumber:
      break;
  }
  return tagValue;
}

std::string ShowStored(const SettingEntry& setting, const StoredValue& value) {
  if (const auto* const text = std::get_if<std::string>(&value)) {
    return ShowSetting(setting, *text);
  }
  if (const auto* const flag = std::get_if<bool>(&value)) {
    return ShowSetting(setting, *flag ? "1" : "0");
  }
  return ShowSetting(setting, std::to_string(std::get<int>(value)));
}

std::string ShowConfigured(const SettingEntry& setting, const std::string& configValue) {
  if (setting.form == SettingForm::kNumber) {
    return std::to_string(std::strtol(configValue.c_str(), nullptr, 0));
  }
  return setting.form == SettingForm::kHexText ? NormalHexText(configValue) : configValue;
}

bool ParseSetting(const SettingEntry& setting, const std::string& value, std::string* tagValue,
                  std::string* error) {
  const std::optional<std::string> parsed = Parse(setting, value);
  if (!parsed) {
    *error = std::string(setting.key) + " is " + AllowedValues(setting) + ", not \"" + value + "\"";
    return false;
  }
  *tagValue = *parsed;
  return true;
}

std::string AllowedValues(const SettingEntry& setting) {
  if (IsIn(setting, "SP_Baud")) {
    return Join(kBaudrates);
  }
  if (IsIn(setting, "SP_Bits")) {
    return Join(kDataBits);
  }
  if (IsIn(setting, "SP_Stop")) {
    return Join(kStopBits);
  }
  switch (setting.form) {
    case SettingForm::kParity:
      return Join(kParityNames);
    case SettingForm::kMode:
      return Join(kModeNames);
    case SettingForm::kBoolean:
      return "true or false";
    case SettingForm::kHexText:
      return "an even number of hexadecimal digits or none";
    case SettingForm::kNumber:
      break;
  }
  return "a number";
}

std::string SettingNames() {
  std::string text;
  for (const SettingEntry& setting : kSettingTable) {
    text += (text.empty() ? "" : ", ") + std::string(setting.key);
  }
  return text;
}
