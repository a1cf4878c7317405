// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <atomic>
#include <string>

#include "protlib/LeafMutex.h"

// Error codes that the driver records.
inline constexpr int kNoErrorYet = 1;
inline constexpr int kGeneralError = -1;
inline constexpr int kNotPossibleNow = -3;
inline constexpr int kConversionError = -9;

// Code and text of the most recent error. Sticky: only the next error overwrites it. Any thread.
class ErrorState {
 public:
  // Records an error; the text is copied. Never throws: without memory for the text it records
  // "Out of memory" in its place.
  void Set(int code, const char* text);

  int Code() const { return code_; }

  // A text that the caller may read in place. It stays readable until kHandedOutTexts other texts
  // have been handed out, so that a host thread can read it while other threads fail. Without
  // memory it says "Out of memory".
  const char* HandOutText();

  // A copy of the text. Throws std::bad_alloc.
  std::string Text() const;

 private:
  static constexpr std::size_t kHandedOutTexts = 16;

  std::atomic<int> code_{kNoErrorYet};
  mutable LeafMutex mutex_;
  std::string text_ LOKA_GUARDED_BY(mutex_);
  std::array<std::string, kHandedOutTexts> handedOut_ LOKA_GUARDED_BY(mutex_);
  std::size_t lastHandedOut_ LOKA_GUARDED_BY(mutex_) = 0;
};
