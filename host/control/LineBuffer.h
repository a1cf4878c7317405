// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <string>
#include <string_view>

// Cuts a byte stream into lines. One thread.
class LineBuffer {
 public:
  explicit LineBuffer(std::size_t maxLineBytes) : maxLineBytes_(maxLineBytes) {}

  // False once a line is longer than allowed.
  bool Append(std::string_view bytes) {
    buffer_ += bytes;
    return buffer_.size() - next_ <= maxLineBytes_ ||
           buffer_.find('\n', next_) != std::string::npos;
  }

  // The next whole line without its end; false when there is none.
  bool Next(std::string* line) {
    const std::size_t end = buffer_.find('\n', next_);
    if (end == std::string::npos) {
      buffer_.erase(0, next_);
      next_ = 0;
      return false;
    }
    line->assign(buffer_, next_, end - next_);
    next_ = end + 1;
    return true;
  }

 private:
  const std::size_t maxLineBytes_;
  std::string buffer_;
  std::size_t next_ = 0;
};
