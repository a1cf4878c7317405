// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

// A number of a configuration text as the driver reads it.
struct ConfigNumber {
  int value = 0;         // past the limits of an int: the limit
  bool isNumber = true;  // false: no digit at the start, which counts as 0
  bool hasRest = false;  // characters stand behind the digits; they are ignored
  int base = 10;         // 16 behind "0x", 8 behind a leading 0
};

// Reads decimal, 0x-prefixed hexadecimal and 0-prefixed octal numbers. Any thread.
ConfigNumber ParseConfigNumber(const std::string& text);
