// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdlib>
#include <limits>

// Reads a number as strtol does (leading white space, a sign, digits of the base, the rest ignored;
// no digits give 0). The result saturates at the limits of 32 bits on every platform, as `long`
// does on the panel's 32-bit processor. `end`, when not null, receives where reading stopped.
inline int ParseInt(const char* text, int base, const char** end = nullptr) {
  char* stop = nullptr;
  const long value = std::strtol(text, &stop, base);
  if (end != nullptr) {
    *end = stop;
  }
  if (value > std::numeric_limits<int>::max()) {
    return std::numeric_limits<int>::max();
  }
  if (value < std::numeric_limits<int>::min()) {
    return std::numeric_limits<int>::min();
  }
  return static_cast<int>(value);
}
