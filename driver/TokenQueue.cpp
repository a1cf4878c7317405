// SPDX-License-Identifier: Apache-2.0
#include "driver/TokenQueue.h"

#include <utility>

void TokenQueue::Push(std::string token, int capacity) {
  const LeafLock lock(mutex_);
  const bool isFull = !tokens_.empty() && static_cast<long long>(tokens_.size()) >= capacity;
  tokens_.push_back(std::move(token));  // first, so that a failure loses nothing
  if (isFull) {
    tokens_.pop_front();
  }
}

int TokenQueue::Count() const {
  const LeafLock lock(mutex_);
  return static_cast<int>(tokens_.size());
}

int TokenQueue::FrontLength() const {
  const LeafLock lock(mutex_);
  return tokens_.empty() ? 0 : static_cast<int>(tokens_.front().size());
}

std::string TokenQueue::Front() const {
  const LeafLock lock(mutex_);
  return tokens_.empty() ? std::string() : tokens_.front();
}

void TokenQueue::PopFront() {
  const LeafLock lock(mutex_);
  if (!tokens_.empty()) {
    tokens_.pop_front();
  }
}

void TokenQueue::Clear() {
  std::deque<std::string> dropped;  // freed without holding the lock
  const LeafLock lock(mutex_);
  dropped.swap(tokens_);
}
