// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstring>
#include <initializer_list>
#include <string>
#include <vector>

using Bytes = std::vector<unsigned char>;

// The bytes of a number as they lie in memory.
template <typename Number>
Bytes BytesOf(Number number) {
  Bytes bytes(sizeof number);
  std::memcpy(bytes.data(), &number, sizeof number);
  return bytes;
}

// The number at the start of some bytes.
template <typename Number>
Number NumberIn(const unsigned char* bytes) {
  Number number{};
  std::memcpy(&number, bytes, sizeof number);
  return number;
}
