// SPDX-License-Identifier: Apache-2.0
#include "protlib/ErrorState.h"

#include <exception>

namespace {

constexpr const char* kOutOfMemory = "Out of memory";  // short enough for a string without memory

}  // namespace

void ErrorState::Set(int code, const char* text) {
  const LeafLock lock(mutex_);
  try {
    text_ = text;
  } catch (const std::exception&) {
    text_ = kOutOfMemory;
  }
  code_ = code;
}

const char* ErrorState::HandOutText() {
  const LeafLock lock(mutex_);
  if (handedOut_[lastHandedOut_] != text_) {
    const std::size_t next = (lastHandedOut_ + 1) % kHandedOutTexts;
    try {
      handedOut_[next] = text_;
    } catch (const std::exception&) {
      return kOutOfMemory;
    }
    lastHandedOut_ = next;
  }
  return handedOut_[lastHandedOut_].c_str();
}

std::string ErrorState::Text() const {
  const LeafLock lock(mutex_);
  return text_;
}
