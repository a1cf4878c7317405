// SPDX-License-Identifier: Apache-2.0
#include "host/instance/SettingsReport.h"

#include <algorithm>
#include <array>
#include <utility>

#include "host/framing/ConfigText.h"
#include "host/instance/SettingTable.h"
#include "host/port/LineSettings.h"
#include "host/runtime/HostSession.h"

namespace {

constexpr unsigned int kDefaultGapMs = 500;

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
  return tag != nullptr && tag->ReadText(&text) ? ShowSetting(*FindSettingOfMemoryType(name), text)
                                                : "?";
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
  for (const SettingEntry& setting : kSettingTable) {
    const auto found = std::find_if(stored.begin(), stored.end(), [&](const auto& entry) {
      return entry.first.second == setting.key;
    });
    if (found == stored.end()) {
      continue;
    }
    const std::string active = ShowStored(setting, found->second);
    const std::string configured =
        ShowConfigured(setting, ConfigValue(configuration, setting.configKey, setting.fallback));
    if (active != configured) {
      std::string line = std::string("stored override: ") + setting.key;
      line += " " + active;
      line += " instead of " + configured;
      lines.push_back(std::move(line));
    }
  }
  return lines;
}
