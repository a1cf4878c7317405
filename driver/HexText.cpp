// SPDX-License-Identifier: Apache-2.0
#include "driver/HexText.h"

#include <algorithm>
#include <cstring>

namespace {

constexpr const char* kNoBytes = "none";

bool IsHexDigit(char c) {
  return (c >= '0' && c <= '9') || (c >= 'A' && c <= 'F') || (c >= 'a' && c <= 'f');
}

unsigned int NibbleValue(char c) {
  if (c >= '0' && c <= '9') {
    return static_cast<unsigned int>(c - '0');
  }
  if (c >= 'A' && c <= 'F') {
    return static_cast<unsigned int>(c - 'A' + 10);
  }
  constexpr unsigned int kLowerCaseBase = 'a' - 10;
  return static_cast<unsigned char>(c) - kLowerCaseBase;  // wraps; only the low byte counts
}

}  // namespace

bool isHex(const char* text) {
  if (text == nullptr) {
    return false;
  }
  const std::size_t length = std::strlen(text);
  return std::strcmp(text, kNoBytes) == 0 ||
         (length % 2 == 0 && std::all_of(text, text + length, IsHexDigit));
}

std::string fromHex(const std::string& text) {
  std::string bytes;
  if (text == kNoBytes) {
    return bytes;
  }
  bytes.reserve((text.size() + 1) / 2);
  for (std::size_t i = 0; i < text.size(); i += 2) {
    const char low = i + 1 < text.size() ? text[i + 1] : '\0';
    bytes.push_back(static_cast<char>(
        static_cast<unsigned char>(NibbleValue(text[i]) * 16U + NibbleValue(low))));
  }
  return bytes;
}

std::string ToHex(std::string_view bytes) {
  std::string text;
  ToHex(bytes, text);
  return text;
}

void ToHex(std::string_view bytes, std::string& text) {
  constexpr const char* kDigits = "0123456789ABCDEF";
  text.resize(bytes.size() * 2);
  std::size_t place = 0;
  for (const char c : bytes) {
    const auto byte = static_cast<unsigned char>(c);
    text[place++] = kDigits[byte >> 4U];
    text[place++] = kDigits[byte & 0x0FU];
  }
}
