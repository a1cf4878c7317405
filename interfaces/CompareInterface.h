// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstring>

// True when the two interface names are equal byte for byte (case-sensitive, same length). A null
// name equals nothing. Any thread.
inline bool CompareInterface(const char* a, const char* b) {
  return a != nullptr && b != nullptr && std::strcmp(a, b) == 0;
}
