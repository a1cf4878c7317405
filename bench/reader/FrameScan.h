// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <string>

#include "bench/reader/ReaderReport.h"

// The scan that people write by hand over a read function: bytes between 02 and 03, one at a time.
class FrameScan {
 public:
  explicit FrameScan(ReaderReport* report) : report_(report) {}

  // False after the last token.
  bool Take(const unsigned char* bytes, std::size_t count) {
    for (std::size_t i = 0; i < count; ++i) {
      const unsigned char byte = bytes[i];
      if (byte == 0x02) {
        frame_.clear();
        isInFrame_ = true;
      } else if (byte == 0x03 && isInFrame_) {
        isInFrame_ = false;
        if (!report_->OnToken(frame_)) {
          return false;
        }
      } else if (isInFrame_) {
        frame_.push_back(static_cast<char>(byte));
      }
    }
    return true;
  }

 private:
  ReaderReport* const report_;
  std::string frame_;
  bool isInFrame_ = false;
};
