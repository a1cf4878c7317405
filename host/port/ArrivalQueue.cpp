// SPDX-License-Identifier: Apache-2.0
#include "host/port/ArrivalQueue.h"

#include <chrono>
#include <utility>

std::size_t ArrivalQueue::CostOf(const ArrivedBlock& block) const {
  return sizeof(ArrivedBlock) + block.bytes.size();
}

void ArrivalQueue::Push(ArrivedBlock block) {
  if (block.bytes.empty()) {
    return;
  }
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    const std::size_t cost = CostOf(block);
    blocks_.push_back(std::move(block));
    heldBytes_ += cost;
  }
  // With the mutex free: the receiver would wake up only to wait for it.
  changed_.notify_one();
}

bool ArrivalQueue::IsFull() const {
  const std::lock_guard<std::mutex> lock(mutex_);
  wasFull_ = heldBytes_ >= limitBytes_;
  return wasFull_;
}

bool ArrivalQueue::Peek(std::int64_t* arrivedNs) const {
  const std::lock_guard<std::mutex> lock(mutex_);
  if (blocks_.empty()) {
    return false;
  }
  *arrivedNs = blocks_.front().arrivedNs;
  return true;
}

bool ArrivalQueue::Take(ArrivedBlock* block, bool* hasRoomAgain) {
  const std::lock_guard<std::mutex> lock(mutex_);
  *hasRoomAgain = false;
  if (blocks_.empty()) {
    return false;
  }
  heldBytes_ -= CostOf(blocks_.front());
  *block = std::move(blocks_.front());
  blocks_.pop_front();
  if (wasFull_ && heldBytes_ <= limitBytes_ / 2) {
    wasFull_ = false;
    *hasRoomAgain = true;
  }
  return true;
}

bool ArrivalQueue::WaitUntil(std::int64_t untilNs) {
  const std::chrono::steady_clock::time_point until{std::chrono::nanoseconds(untilNs)};
  std::unique_lock<std::mutex> lock(mutex_);
  (void)changed_.wait_until(lock, until, [this] { return isWoken_ || !blocks_.empty(); });
  return !blocks_.empty();
}

void ArrivalQueue::Wake() {
  const std::lock_guard<std::mutex> lock(mutex_);
  isWoken_ = true;
  changed_.notify_all();
}
