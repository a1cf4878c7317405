// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <algorithm>
#include <cstddef>
#include <string>
#include <vector>

// A buffer between two runs of guard bytes. A write next to it is noticed without a sanitizer, and
// bytes that nobody wrote keep the fill value.
class GuardedBuffer {
 public:
  static constexpr unsigned char kFill = 0xA5;
  static constexpr std::size_t kGuardBytes = 64;

  explicit GuardedBuffer(std::size_t sizeBytes)
      : bytes_(sizeBytes + 2 * kGuardBytes, kFill), sizeBytes_(sizeBytes) {}

  unsigned char* Data() { return bytes_.data() + kGuardBytes; }
  char* Chars() { return reinterpret_cast<char*>(Data()); }

  bool AreGuardsIntact() const {
    const auto isFill = [](unsigned char byte) { return byte == kFill; };
    const auto guard = static_cast<std::ptrdiff_t>(kGuardBytes);
    return std::all_of(bytes_.begin(), bytes_.begin() + guard, isFill) &&
           std::all_of(bytes_.end() - guard, bytes_.end(), isFill);
  }
  bool IsUntouched() const {
    return std::all_of(bytes_.begin(), bytes_.end(),
                       [](unsigned char byte) { return byte == kFill; });
  }
  std::string Bytes() const {
    const auto first = bytes_.begin() + static_cast<std::ptrdiff_t>(kGuardBytes);
    return std::string(first, first + static_cast<std::ptrdiff_t>(sizeBytes_));
  }

 private:
  std::vector<unsigned char> bytes_;
  std::size_t sizeBytes_;
};
