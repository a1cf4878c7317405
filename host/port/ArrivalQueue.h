// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <condition_variable>
#include <cstddef>
#include <cstdint>
#include <deque>
#include <mutex>
#include <string>

// Bytes that came from the line in one piece.
struct ArrivedBlock {
  std::int64_t arrivedNs = 0;  // CLOCK_MONOTONIC
  std::string bytes;
};

// What has arrived and was not taken yet, in order, bounded. Blocks change hands under a lock;
// single bytes never do. Any thread; one of them takes.
class ArrivalQueue {
 public:
  // Roughly what a queue may hold, the overhead of small blocks included.
  explicit ArrivalQueue(std::size_t limitBytes) : limitBytes_(limitBytes) {}
  ~ArrivalQueue() = default;

  ArrivalQueue(const ArrivalQueue&) = delete;
  ArrivalQueue& operator=(const ArrivalQueue&) = delete;

  // Appends a block and wakes the one who waits. An empty block is left out. May exceed the limit:
  // whoever fills asks IsFull before it reads the line.
  void Push(ArrivedBlock block);

  bool IsFull() const;

  // The arrival of the oldest block; false when there is none.
  bool Peek(std::int64_t* arrivedNs) const;

  // Takes the oldest block; false when there is none. `hasRoomAgain` says that the queue was full
  // before IsFull was last asked and is half empty now.
  bool Take(ArrivedBlock* block, bool* hasRoomAgain);

  // Waits until there is a block, Wake is called or the time (CLOCK_MONOTONIC) has come. True when
  // there is a block.
  bool WaitUntil(std::int64_t untilNs);

  // Ends waits, from now on.
  void Wake();

 private:
  std::size_t CostOf(const ArrivedBlock& block) const;

  const std::size_t limitBytes_;
  mutable std::mutex mutex_;
  std::condition_variable changed_;
  std::deque<ArrivedBlock> blocks_;
  std::size_t heldBytes_ = 0;
  mutable bool wasFull_ = false;
  bool isWoken_ = false;
};
