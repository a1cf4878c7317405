// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <algorithm>
#include <cstddef>
#include <string>

// The bytes of one fuzz input, read from the front. Behind the end there are zeros and empty texts,
// so that every input is a valid one.
class FuzzInput {
 public:
  FuzzInput(const unsigned char* data, std::size_t size) : data_(data), left_(size) {}

  bool IsEmpty() const { return left_ == 0; }

  unsigned int Byte() {
    if (left_ == 0) return 0;
    --left_;
    return *data_++;
  }

  bool Flag() { return Byte() % 2 != 0; }

  // Four bytes, little-endian.
  int Int() {
    unsigned int value = 0;
    for (unsigned int shift = 0; shift < 32; shift += 8) value |= Byte() << shift;
    return static_cast<int>(value);
  }

  // A number from 0 to count - 1.
  std::size_t Below(std::size_t count) {
    const unsigned int high = count > 256 ? Byte() : 0;
    return (high << 8U | Byte()) % count;
  }

  // A length byte and so many bytes, as far as they are there.
  std::string Text() { return Take(Byte()); }

  // The bytes in front of the next line feed; the line feed goes too.
  std::string Line() {
    const auto* const end = std::find(data_, data_ + left_, static_cast<unsigned char>('\n'));
    std::string line = Take(static_cast<std::size_t>(end - data_));
    Byte();
    return line;
  }

  std::string Rest() { return Take(left_); }

 private:
  std::string Take(std::size_t count) {
    count = std::min(count, left_);
    std::string text(data_, data_ + count);
    data_ += count;
    left_ -= count;
    return text;
  }

  const unsigned char* data_;
  std::size_t left_;
};
