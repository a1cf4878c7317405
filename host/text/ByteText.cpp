// SPDX-License-Identifier: Apache-2.0
#include "host/text/ByteText.h"

#include <cstddef>

namespace {

constexpr std::string_view kUpperDigits = "0123456789ABCDEF";
constexpr std::string_view kLowerDigits = "0123456789abcdef";

// The letter that C writes behind a backslash for this byte, or 0.
char CLetter(unsigned char byte) {
  constexpr std::string_view kEscapedBytes = "\a\b\f\n\r\t\v\\\"";
  constexpr std::string_view kEscapeLetters = "abfnrtv\\\"";
  const std::size_t position = kEscapedBytes.find(static_cast<char>(byte));
  return position == std::string_view::npos ? '\0' : kEscapeLetters[position];
}

void AppendEscaped(unsigned char byte, std::string* text) {
  const char letter = CLetter(byte);
  if (letter != '\0') {
    *text += '\\';
    *text += letter;
  } else if (byte >= 0x20 && byte < 0x7F) {
    *text += static_cast<char>(byte);
  } else {
    *text += "\\x";
    *text += kLowerDigits[byte >> 4U];
    *text += kLowerDigits[byte & 0x0FU];
  }
}

int DigitValue(char character) {
  if (character >= '0' && character <= '9') {
    return character - '0';
  }
  if (character >= 'A' && character <= 'F') {
    return character - 'A' + 10;
  }
  if (character >= 'a' && character <= 'f') {
    return character - 'a' + 10;
  }
  return -1;
}

}  // namespace

std::string EscapeBytes(std::string_view bytes) {
  std::string text;
  text.reserve(bytes.size());
  for (const char byte : bytes) {
    AppendEscaped(static_cast<unsigned char>(byte), &text);
  }
  return text;
}

std::string HexBytes(std::string_view bytes) {
  std::string text;
  text.reserve(bytes.size() * 3);
  for (const char character : bytes) {
    const auto byte = static_cast<unsigned char>(character);
    if (!text.empty()) {
      text += ' ';
    }
    text += kUpperDigits[byte >> 4U];
    text += kUpperDigits[byte & 0x0FU];
  }
  return text;
}

std::string CompactHex(std::string_view bytes) {
  std::string text;
  text.reserve(bytes.size() * 2);
  for (const char character : bytes) {
    const auto byte = static_cast<unsigned char>(character);
    text += kUpperDigits[byte >> 4U];
    text += kUpperDigits[byte & 0x0FU];
  }
  return text;
}

bool ParseHexBytes(std::string_view text, std::string* bytes) {
  std::string result;
  int high = -1;
  for (const char character : text) {
    if (character == ' ' && high < 0) {
      continue;
    }
    const int digit = DigitValue(character);
    if (digit < 0) {
      return false;
    }
    if (high < 0) {
      high = digit;
    } else {
      result += static_cast<char>(static_cast<unsigned char>(high * 16 + digit));
      high = -1;
    }
  }
  if (high >= 0) {
    return false;
  }
  *bytes = std::move(result);
  return true;
}
