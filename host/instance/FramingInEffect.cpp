// SPDX-License-Identifier: Apache-2.0
#include "host/instance/FramingInEffect.h"

#include <array>
#include <cstdlib>

#include "host/text/FirstWord.h"

namespace {

constexpr const char* kDone = "OK";

std::string Active(const SettingsBook& book, const char* key) {
  return book.Of(*FindSetting(key)).active;
}

int ActiveNumber(const SettingsBook& book, const char* key) {
  return static_cast<int>(std::strtol(Active(book, key).c_str(), nullptr, 10));
}

}  // namespace

void FramingInEffect::OnApplied(const SettingsBook& book) {
  settings_.rxPrefix = BytesOfHexText(Active(book, "rx_prefix"));
  settings_.rxSuffix = BytesOfHexText(Active(book, "rx_suffix"));
  settings_.txPrefix = BytesOfHexText(Active(book, "tx_prefix"));
  settings_.txSuffix = BytesOfHexText(Active(book, "tx_suffix"));
  settings_.gapMs = ActiveNumber(book, "gap");
  settings_.isHex = Active(book, "hex_tokens") == "true";
  settings_.queueTokens = ActiveNumber(book, "token_queue_size");
}

void FramingInEffect::OnConsole(const std::string& line, const std::string& reply) {
  const std::string command = FirstWord(line);
  if (reply != kDone || line.size() <= command.size()) {
    return;
  }
  const std::string argument = FirstWord(line.substr(command.size() + 1));
  struct HexCommand {
    const char* name;
    std::string FramingSettings::*field;
  };
  const std::array<HexCommand, 4> hexCommands = {{{"set_rxPrefix", &FramingSettings::rxPrefix},
                                                  {"set_rxSuffix", &FramingSettings::rxSuffix},
                                                  {"set_txPrefix", &FramingSettings::txPrefix},
                                                  {"set_txSuffix", &FramingSettings::txSuffix}}};
  for (const HexCommand& hexCommand : hexCommands) {
    if (command == hexCommand.name) {
      settings_.*hexCommand.field = BytesOfHexText(argument);
    }
  }
  if (command == "set_rxGap") {
    settings_.gapMs = static_cast<int>(std::strtol(argument.c_str(), nullptr, 10));
  } else if (command == "set_hexToken") {
    settings_.isHex = argument == "ON";
  }
}
