// SPDX-License-Identifier: Apache-2.0
#include "protlib/ErrorState.h"

#include <exception>

void ErrorState::Set(int code, const char* text) {
  const LeafLock lock(mutex_);
  const std::size_t next = (current_ + 1) % kKeptTexts;
  try {
    texts_[next] = text;
  } catch (const std::exception&) {
    texts_[next] = "Out of memory";  // short enough to need no memory
  }
  current_ = next;
  code_ = code;
}

const char* ErrorState::Text() const {
  const LeafLock lock(mutex_);
  return texts_[current_].c_str();
}
