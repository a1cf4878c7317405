// SPDX-License-Identifier: Apache-2.0
#include "host/text/Utf8Text.h"

#include "host/text/ByteText.h"

namespace {

struct CodePoint {
  unsigned int value = 0;
  std::size_t lengthBytes = 0;  // 0: no well-formed character
};

unsigned int ByteAt(std::string_view text, std::size_t index) {
  return static_cast<unsigned char>(text[index]);
}

// How many bytes a character has that starts with this byte; 0 for a byte that starts none.
std::size_t LengthFrom(unsigned int first) {
  if (first < 0x80) {
    return 1;
  }
  if (first < 0xC2 || first > 0xF4) {
    return 0;
  }
  return first < 0xE0 ? 2 : (first < 0xF0 ? 3 : 4);
}

bool IsScalarValue(unsigned int value, std::size_t lengthBytes) {
  constexpr unsigned int kSmallest[] = {0, 0, 0x80, 0x800, 0x10000};
  const bool isSurrogate = value >= 0xD800 && value <= 0xDFFF;
  return value >= kSmallest[lengthBytes] && value <= 0x10FFFF && !isSurrogate;
}

// The character at the start of a text that is not empty.
CodePoint FirstCodePoint(std::string_view text) {
  const unsigned int first = ByteAt(text, 0);
  const std::size_t length = LengthFrom(first);
  if (length < 2) {
    return {first, length};
  }
  if (text.size() < length) {
    return {};
  }
  unsigned int value = first & (0x7FU >> length);
  for (std::size_t i = 1; i < length; ++i) {
    if ((ByteAt(text, i) & 0xC0U) != 0x80U) {
      return {};
    }
    value = (value << 6U) | (ByteAt(text, i) & 0x3FU);
  }
  return IsScalarValue(value, length) ? CodePoint{value, length} : CodePoint{};
}

bool IsControl(unsigned int value) {
  return value != '\n' && value != '\t' && (value < 0x20 || (value >= 0x7F && value < 0xA0));
}

void AppendHex(std::string_view bytes, std::string* text) {
  for (const char byte : bytes) {
    *text += "\\x" + HexBytes({&byte, 1});
  }
}

}  // namespace

bool IsUtf8(std::string_view text) {
  while (!text.empty()) {
    const CodePoint point = FirstCodePoint(text);
    if (point.lengthBytes == 0) {
      return false;
    }
    text.remove_prefix(point.lengthBytes);
  }
  return true;
}

std::string PrintableUtf8(std::string_view text) {
  std::string printable;
  while (!text.empty()) {
    const CodePoint point = FirstCodePoint(text);
    const std::size_t length = point.lengthBytes == 0 ? 1 : point.lengthBytes;
    if (point.lengthBytes == 0 || IsControl(point.value)) {
      AppendHex(text.substr(0, length), &printable);
    } else {
      printable += text.substr(0, length);
    }
    text.remove_prefix(length);
  }
  return printable;
}
