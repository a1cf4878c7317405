// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <deque>
#include <string>

#include "protlib/LeafMutex.h"

// The tokens that were received and not acknowledged yet, oldest at the front. Any thread.
class TokenQueue {
 public:
  // Appends a token. When `capacity` tokens or more are there already, the oldest one goes; a
  // capacity of zero or less keeps one token. Throws std::bad_alloc, and has then changed nothing.
  void Push(std::string token, int capacity);

  // Number of tokens.
  int Count() const;

  // Length of the oldest token in bytes, 0 without one.
  int FrontLength() const;

  // A copy of the oldest token; empty without one.
  std::string Front() const;

  // Removes the oldest token, if any.
  void PopFront();

  void Clear();

 private:
  mutable LeafMutex mutex_;
  std::deque<std::string> tokens_ LOKA_GUARDED_BY(mutex_);
};
