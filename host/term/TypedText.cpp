// SPDX-License-Identifier: Apache-2.0
#include "host/term/TypedText.h"

#include <cstddef>

#include "host/text/ByteText.h"

namespace {

constexpr std::string_view kLetters = "abefnrtv\\\"'?";
constexpr std::string_view kMeanings = "\a\b\x1B\f\n\r\t\v\\\"'?";
constexpr std::size_t kHexDigits = 2;
constexpr std::size_t kMaxOctalDigits = 3;
constexpr unsigned int kMaxByte = 0xFF;

bool IsOctal(char c) { return c >= '0' && c <= '7'; }

// All three read what stands behind the backslash at the start of `rest`. They return how many
// characters they used, 0 when it is none of theirs.

std::size_t ReadLetter(std::string_view rest, std::string* bytes) {
  const std::size_t found = kLetters.find(rest.front());
  if (found == std::string_view::npos) {
    return 0;
  }
  bytes->push_back(kMeanings[found]);
  return 1;
}

std::size_t ReadHex(std::string_view rest, std::string* bytes) {
  std::string byte;
  if (rest.front() != 'x' || rest.size() <= kHexDigits ||
      !ParseHexBytes(rest.substr(1, kHexDigits), &byte) || byte.size() != 1) {
    return 0;
  }
  *bytes += byte;
  return 1 + kHexDigits;
}

std::size_t ReadOctal(std::string_view rest, std::string* bytes) {
  unsigned int value = 0;
  std::size_t count = 0;
  while (count < kMaxOctalDigits && count < rest.size() && IsOctal(rest[count])) {
    value = value * 8 + static_cast<unsigned int>(rest[count] - '0');
    ++count;
  }
  if (count == 0 || value > kMaxByte) {
    return 0;
  }
  bytes->push_back(static_cast<char>(static_cast<unsigned char>(value)));
  return count;
}

}  // namespace

bool ParseTypedText(std::string_view text, std::string* bytes, std::string* error) {
  std::string result;
  while (!text.empty()) {
    if (text.front() != '\\') {
      result.push_back(text.front());
      text.remove_prefix(1);
      continue;
    }
    text.remove_prefix(1);
    std::size_t used = 0;
    if (!text.empty()) {
      used = ReadLetter(text, &result);
      used = used > 0 ? used : ReadHex(text, &result);
      used = used > 0 ? used : ReadOctal(text, &result);
    }
    if (used == 0) {
      *error =
          "behind a backslash: one of a b e f n r t v \\ \" ' ?, x and two hexadecimal digits, or "
          "up "
          "to three octal digits";
      return false;
    }
    text.remove_prefix(used);
  }
  *bytes = std::move(result);
  return true;
}
