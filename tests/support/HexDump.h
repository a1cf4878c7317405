// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

// The bytes as two upper-case digits each, separated by blanks: "02 41 03".
inline std::string HexDump(const std::string& bytes) {
  static const char kDigits[] = "0123456789ABCDEF";
  std::string text;
  for (const char c : bytes) {
    const unsigned value = static_cast<unsigned char>(c);
    if (!text.empty()) text += ' ';
    text += kDigits[value >> 4U];
    text += kDigits[value & 0x0FU];
  }
  return text;
}
