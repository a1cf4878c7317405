// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <cstddef>
#include <cstring>
#include <memory>
#include <new>

// A zero-filled buffer for the duration of one access: on the stack up to StackBytes bytes,
// otherwise allocated. Check IsValid before use: a negative size or a failed allocation leaves no
// buffer.
template <std::size_t StackBytes>
class WorkBuffer {
 public:
  // NOLINTNEXTLINE(cppcoreguidelines-pro-type-member-init): see stack_
  explicit WorkBuffer(long long sizeBytes) {
    if (sizeBytes < 0) {
      return;
    }
    const auto size = static_cast<unsigned long long>(sizeBytes);
    if (size <= StackBytes) {
      data_ = stack_.data();
      std::memset(data_, 0, static_cast<std::size_t>(size));
    } else if (size <= static_cast<std::size_t>(-1) / 2) {
      heap_.reset(new (std::nothrow) unsigned char[static_cast<std::size_t>(size)]());
      data_ = heap_.get();
    }
  }
  WorkBuffer(const WorkBuffer&) = delete;
  WorkBuffer& operator=(const WorkBuffer&) = delete;
  ~WorkBuffer() = default;

  bool IsValid() const { return data_ != nullptr; }
  unsigned char* Data() { return data_; }

 private:
  std::array<unsigned char, StackBytes> stack_;  // filled as far as it is used
  std::unique_ptr<unsigned char[]> heap_;
  unsigned char* data_ = nullptr;
};
