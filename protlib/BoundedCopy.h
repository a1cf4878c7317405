// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <cstring>

// Copies text into a caller's buffer of sizeBytes bytes the way strncpy does: text that is as long
// as the buffer or longer is cut and not terminated, shorter text is followed by zeros to the end
// of the buffer. Does nothing without a buffer or with a size of zero or less.
inline void BoundedCopy(char* buffer, const char* text, int sizeBytes) {
  if (buffer == nullptr || sizeBytes <= 0) {
    return;
  }
  const auto size = static_cast<std::size_t>(sizeBytes);
  const void* end = std::memchr(text, 0, size);
  const auto length =
      end == nullptr ? size : static_cast<std::size_t>(static_cast<const char*>(end) - text);
  std::memcpy(buffer, text, length);
  std::memset(buffer + length, 0, size - length);
}
