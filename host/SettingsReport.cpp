// SPDX-License-Identifier: Apache-2.0
#include "host/SettingsReport.h"

#include <algorithm>
#include <array>
#include <cctype>
#include <cstdlib>

#include "host/ConfigText.h"
#include "host/HostSession.h"
#include "host/LineSettings.h"

namespace {

constexpr std::array<const char*, 5> kParityNames = {"none", "even", "odd", "mark", "space"};
constexpr std::array<const char*, 4> kModeNames = {"RS-232", "RS-485", "RS-422", "RS-485P"};
constexpr unsigned int kDefaultGapMs = 500;

enum class Form { kNumber, kParity, kMode, kHexText, kBoolean };

// A setting under its name in the storage and its key and default in the configuration.
struct Setting {
  const char* storedKey;
  const char* configKey;
  const char* fallback;
  Form form;
};

constexpr std::array<Setting, 12> kSettings = {
    {{"baud", "baudrate", "0", Form::kNumber},
     {"parity", "parity", "none", Form::kParity},
     {"bits", "bits", "0", Form::kNumber},
     {"stop", "stopbits", "0", Form::kNumber},
     {"mode", "mode", "RS-232", Form::kMode},
     {"rx_prefix", "rx_prefix", "", Form::kHexText},
     {"rx_suffix", "rx_suffix", "", Form::kHexText},
     {"tx_prefix", "tx_prefix", "", Form::kHexText},
     {"tx_suffix", "tx_suffix", "", Form::kHexText},
     {"gap", "gap", "0", Form::kNumber},
     {"hex_tokens", "hex_tokens", "false", Form::kBoolean},
     {"token_queue_size", "token_queue_size", "100", Form::kNumber}}};

template <std::size_t count>
std::string NameOf(const std::array<const char*, count>& names, int code) {
  const auto index = static_cast<std::size_t>(code);
  return index < count ? names[index] : std::to_string(code);
}

// Hexadecimal text in one spelling: upper case, and "none" for the empty text.
std::string NormalHexText(const std::string& text) {
  if (text.empty() || text == "none") {
    return "none";
  }
  std::string result = text;
  std::transform(result.begin(), result.end(), result.begin(),
                 [](unsigned char c) { return static_cast<char>(std::toupper(c)); });
  return result;
}

std::string ShowStored(const StoredValue& value, Form form) {
  if (const auto* const text = std::get_if<std::string>(&value)) {
    return form == Form::kHexText ? NormalHexText(*text) : *text;
  }
  if (const auto* const flag = std::get_if<bool>(&value)) {
    return *flag ? "true" : "false";
  }
  const int number = std::get<int>(value);
  if (form == Form::kParity) {
    return NameOf(kParityNames, number);
  }
  return form == Form::kMode ? NameOf(kModeNames, number) : std::to_string(number);
}

std::string ShowConfigured(const std::string& text, Form form) {
  if (form == Form::kNumber) {
    return std::to_string(std::strtol(text.c_str(), nullptr, 0));
  }
  return form == Form::kHexText ? NormalHexText(text) : text;
}

bool ReadNumber(HostSession* session, const std::string& name, const char* type,
                unsigned int* value) {
  std::string error;
  const auto tag = session->CreateTag("0?" + name + "?" + type, &error);
  return tag != nullptr && tag->ReadNumber(value);
}

std::string ReadHexText(HostSession* session, const std::string& name) {
  std::string error;
  std::string text;
  const auto tag = session->CreateTag("0?" + name + "?string-4096", &error);
  return tag != nullptr && tag->ReadText(&text) ? NormalHexText(text) : "?";
}

bool ReadLineSettings(HostSession* session, LineSettings* settings) {
  unsigned int baudrate = 0;
  std::array<unsigned int, 4> bytes{};
  constexpr std::array<const char*, 4> kNames = {"SP_Par", "SP_Bits", "SP_Stop", "SP_Mode"};
  bool isRead = ReadNumber(session, "SP_Baud", "unsignedInt", &baudrate);
  for (std::size_t i = 0; i < kNames.size(); ++i) {
    isRead = isRead && ReadNumber(session, kNames[i], "unsignedByte", &bytes[i]);
  }
  *settings = {static_cast<int>(baudrate), static_cast<int>(bytes[0]), static_cast<int>(bytes[1]),
               static_cast<int>(bytes[2]), static_cast<int>(bytes[3])};
  return isRead;
}

std::string DescribeFraming(HostSession* session) {
  unsigned int gapMs = 0;
  unsigned int hexTokens = 0;
  unsigned int queueSize = 0;
  if (!ReadNumber(session, "SP_Gap", "unsignedInt", &gapMs) ||
      !ReadNumber(session, "SP_HexTokens", "boolean", &hexTokens) ||
      !ReadNumber(session, "SP_TokenQueueSize", "unsignedInt", &queueSize)) {
    return {};
  }
  std::string text = "rx " + ReadHexText(session, "SP_RxPrefix");
  text += " ... " + ReadHexText(session, "SP_RxSuffix");
  text += "  tx " + ReadHexText(session, "SP_TxPrefix");
  text += " ... " + ReadHexText(session, "SP_TxSuffix");
  text += "  gap " + std::to_string(gapMs);
  text += gapMs == 0 ? " (" + std::to_string(kDefaultGapMs) + " ms)" : " ms";
  text += hexTokens != 0 ? "  hex tokens on" : "  hex tokens off";
  text += "  queue " + std::to_string(queueSize);
  return text;
}

}  // namespace

std::vector<std::string> DescribeSettings(HostSession* session, const std::string& portName,
                                          const std::string& portPath) {
  std::vector<std::string> lines;
  LineSettings settings;
  if (ReadLineSettings(session, &settings)) {
    lines.push_back(portName + " = " + portPath + "  " + DescribeLine(settings));
  }
  const std::string framing = DescribeFraming(session);
  if (!framing.empty()) {
    lines.push_back(framing);
  }
  return lines;
}

std::vector<std::string> DescribeOverrides(const std::string& configuration,
                                           const SqliteFile::Values& stored) {
  std::vector<std::string> lines;
  for (const Setting& setting : kSettings) {
    const auto found = std::find_if(stored.begin(), stored.end(), [&](const auto& entry) {
      return entry.first.second == setting.storedKey;
    });
    if (found == stored.end()) {
      continue;
    }
    const std::string active = ShowStored(found->second, setting.form);
    const std::string configured = ShowConfigured(
        ConfigValue(configuration, setting.configKey, setting.fallback), setting.form);
    if (active != configured) {
      lines.push_back(std::string("stored override: ") + setting.storedKey + " " + active +
                      " instead of " + configured);
    }
  }
  return lines;
}
