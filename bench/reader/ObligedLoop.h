// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <string_view>

#include "interfaces/ISemaphore.h"
#include "interfaces/ISerialPort.h"

// The least that a driver can do which has to ask its host for every byte under a semaphore: lock,
// receive one byte, unlock, append, compare. The reader under measurement and the measurements in
// memory use the same loop.
class ObligedLoop {
 public:
  enum class Compare {
    kWholeTail,      // takes the tail of the buffer and compares it with the suffix, for each byte
    kLastByteFirst,  // looks at the whole tail only behind the suffix's last byte
  };

  ObligedLoop(ISerialPort* port, ISemaphore* semaphore, Compare compare)
      : port_(port), semaphore_(semaphore), compare_(compare) {}

  // Receives one token of a frame 02 ... 03 with time-out 500 ms. False after a time-out.
  bool Next(std::string_view* token) {
    constexpr int kTimeoutMs = 500;
    buffer_.clear();
    std::size_t matched = 0;
    for (;;) {
      unsigned char byte = 0;
      semaphore_->Lock();
      const int result = port_->Receive(&byte, kTimeoutMs, 0);
      semaphore_->Unlock();
      if (result == 0) {
        return false;
      }
      const char character = static_cast<char>(byte);
      if (matched < prefix_.size()) {
        matched = character == prefix_[matched] ? matched + 1 : 0;
        if (matched == prefix_.size()) {
          buffer_ = prefix_;
        }
        continue;
      }
      buffer_.push_back(character);
      if (IsComplete(character)) {
        *token = std::string_view(buffer_).substr(prefix_.size(),
                                                  buffer_.size() - prefix_.size() - suffix_.size());
        return true;
      }
    }
  }

 private:
  bool IsComplete(char last) const {
    if (compare_ == Compare::kLastByteFirst && last != suffix_.back()) {
      return false;
    }
    return buffer_.size() >= suffix_.size() &&
           buffer_.substr(buffer_.size() - suffix_.size()) == suffix_;
  }

  ISerialPort* const port_;
  ISemaphore* const semaphore_;
  const Compare compare_;
  const std::string prefix_ = "\x02";
  const std::string suffix_ = "\x03";
  std::string buffer_;
};
