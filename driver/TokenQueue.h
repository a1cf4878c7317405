// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

#include "protlib/LeafMutex.h"

// The tokens that were received and not acknowledged yet, oldest at the front. Any thread.
class TokenQueue {
 public:
  // Appends a token, as it is or as hexadecimal text. When `capacity` tokens or more are there
  // already, the oldest one goes; a capacity of zero or less keeps one token. Throws
  // std::bad_alloc, and has then changed nothing.
  void Push(std::string_view token, int capacity);
  void PushHex(std::string_view token, int capacity);

  // Number of tokens.
  int Count() const;

  // Length of the oldest token in bytes, 0 without one.
  int FrontLength() const;

  // A copy of the oldest token; empty without one.
  std::string Front() const;

  // Hands the oldest token to `use`, a pointer that is null without one, and returns its result.
  // `use` runs under the queue's lock: it is short and takes no other lock.
  template <typename Use>
  auto WithFront(Use use) const {
    const LeafLock lock(mutex_);
    return use(count_ == 0 ? nullptr : &slots_[first_]);
  }

  // Removes the oldest token, if any.
  void PopFront();

  void Clear();

 private:
  std::string& FreeSlot() LOKA_REQUIRES(mutex_);
  void Queue(int capacity) LOKA_REQUIRES(mutex_);
  void DropFront() LOKA_REQUIRES(mutex_);

  mutable LeafMutex mutex_;
  // A ring whose size is a power of two: count_ tokens from first_ on. A slot keeps the memory of a
  // short token for the next one.
  std::vector<std::string> slots_ LOKA_GUARDED_BY(mutex_);
  std::size_t first_ LOKA_GUARDED_BY(mutex_) = 0;
  std::size_t count_ LOKA_GUARDED_BY(mutex_) = 0;
};
