// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstring>
#include <string>

// Where the value of a memory type goes: a place in a buffer and the room left there. A value that
// is longer than the room is cut to it.
class ReadTarget {
 public:
  ReadTarget(unsigned char* place, std::size_t roomBytes) : place_(place), roomBytes_(roomBytes) {}

  void PutByte(int value) {
    const auto byte = static_cast<unsigned char>(value);
    Put(&byte, sizeof byte);
  }

  // 32 bits in the byte order of the machine.
  void PutInt32(int value) { Put(&value, sizeof value); }

  // The text up to its first zero, and one zero.
  void PutText(const std::string& text) { Put(text.c_str(), std::strlen(text.c_str()) + 1); }

 private:
  void Put(const void* value, std::size_t lengthBytes) {
    std::memcpy(place_, value, std::min(lengthBytes, roomBytes_));
  }

  unsigned char* place_;
  std::size_t roomBytes_;
};
