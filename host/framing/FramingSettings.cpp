// SPDX-License-Identifier: Apache-2.0
#include "host/framing/FramingSettings.h"

#include <algorithm>
#include <cstddef>

#include "host/framing/ConfigNumber.h"
#include "host/framing/ConfigText.h"

namespace {

bool IsHexDigit(char character) {
  return (character >= '0' && character <= '9') || (character >= 'A' && character <= 'F') ||
         (character >= 'a' && character <= 'f');
}

unsigned int HalfByte(char character) {
  const auto code = static_cast<unsigned char>(character);
  if (code >= '0' && code <= '9') {
    return code - static_cast<unsigned int>('0');
  }
  if (code >= 'A' && code <= 'F') {
    return code - static_cast<unsigned int>('A') + 10U;
  }
  return (code + 256U - 87U) % 256U;
}

}  // namespace

std::string BytesOfHexText(std::string_view text) {
  std::string bytes;
  if (text == "none") {
    return bytes;
  }
  for (std::size_t i = 0; i < text.size(); i += 2) {
    const char low = i + 1 < text.size() ? text[i + 1] : '\0';
    const unsigned int value = (HalfByte(text[i]) * 16U + HalfByte(low)) % 256U;
    bytes += static_cast<char>(static_cast<unsigned char>(value));
  }
  return bytes;
}

bool IsHexText(std::string_view text) {
  return text == "none" ||
         (text.size() % 2 == 0 && std::all_of(text.begin(), text.end(), IsHexDigit));
}

FramingSettings FramingOfConfiguration(const std::string& configuration) {
  const auto bytes = [&](const char* key) {
    return BytesOfHexText(ConfigValue(configuration, key, ""));
  };
  FramingSettings settings;
  settings.rxPrefix = bytes("rx_prefix");
  settings.rxSuffix = bytes("rx_suffix");
  settings.txPrefix = bytes("tx_prefix");
  settings.txSuffix = bytes("tx_suffix");
  settings.gapMs = ParseConfigNumber(ConfigValue(configuration, "gap", "0")).value;
  settings.isHex = ConfigValue(configuration, "hex_tokens", "false") == "true";
  settings.queueTokens =
      ParseConfigNumber(ConfigValue(configuration, "token_queue_size", "100")).value;
  return settings;
}
