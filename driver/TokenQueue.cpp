// SPDX-License-Identifier: Apache-2.0
#include "driver/TokenQueue.h"

#include <utility>

#include "driver/HexText.h"

namespace {

constexpr std::size_t kSlotsAtFirst = 8;
constexpr std::size_t kMostBytesKeptBySlot = 64;

}  // namespace

void TokenQueue::Push(std::string_view token, int capacity) {
  const LeafLock lock(mutex_);
  FreeSlot().assign(token);
  Queue(capacity);
}

void TokenQueue::PushHex(std::string_view token, int capacity) {
  const LeafLock lock(mutex_);
  ToHex(token, FreeSlot());
  Queue(capacity);
}

// The slot behind the last token; what it holds does not count yet.
std::string& TokenQueue::FreeSlot() {
  if (count_ == slots_.size()) {
    std::vector<std::string> larger(slots_.empty() ? kSlotsAtFirst : 2 * slots_.size());
    for (std::size_t i = 0; i < count_; ++i) {
      larger[i] = std::move(slots_[(first_ + i) & (slots_.size() - 1)]);
    }
    slots_.swap(larger);
    first_ = 0;
  }
  return slots_[(first_ + count_) & (slots_.size() - 1)];
}

// Takes what the free slot holds into the queue; the oldest token goes last, so that a failure
// before loses nothing.
void TokenQueue::Queue(int capacity) {
  const bool isFull = count_ != 0 && static_cast<long long>(count_) >= capacity;
  ++count_;
  if (isFull) {
    DropFront();
  }
}

void TokenQueue::DropFront() {
  std::string& slot = slots_[first_];
  if (slot.capacity() > kMostBytesKeptBySlot) {
    std::string().swap(slot);
  }
  first_ = (first_ + 1) & (slots_.size() - 1);
  --count_;
}

int TokenQueue::Count() const {
  const LeafLock lock(mutex_);
  return static_cast<int>(count_);
}

int TokenQueue::FrontLength() const {
  return WithFront([](const std::string* token) {
    return token == nullptr ? 0 : static_cast<int>(token->size());
  });
}

std::string TokenQueue::Front() const {
  return WithFront(
      [](const std::string* token) { return token == nullptr ? std::string() : *token; });
}

void TokenQueue::PopFront() {
  const LeafLock lock(mutex_);
  if (count_ != 0) {
    DropFront();
  }
}

void TokenQueue::Clear() {
  std::vector<std::string> dropped;  // freed without holding the lock
  const LeafLock lock(mutex_);
  dropped.swap(slots_);
  first_ = 0;
  count_ = 0;
}
