// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <atomic>
#include <cstddef>
#include <cstdint>

#include "interfaces/ISemaphore.h"

// A host semaphore that serves strictly first come, first served: a ticket lock whose waiters sleep
// in the kernel (futex(2)). The receive task takes its semaphore again right after letting it go; a
// lock without an order could make everybody else wait for good. Whoever is next looks for some
// microseconds whether its turn comes before it goes to sleep, and neither operation makes a system
// call unless somebody sleeps. Not recursive.
//
// The favourite. A thread that has taken the semaphore many times with nobody in between becomes
// its favourite and draws no more numbers: it says that it holds the semaphore and looks whether
// anybody has drawn one, two plain accesses of memory without a locked bus cycle. The first number
// that somebody draws ends that: the favourite sees it at its next turn at the latest and queues
// like everybody, and whoever drew it waits until the favourite has let go. What the favourite
// saves in ordering its own two accesses is paid by the other side, which has the kernel order them
// on all processors (membarrier(2)); each such payment makes it twice as hard to become the
// favourite. Where the kernel does not offer that there is no favourite, and a semaphore has had
// enough of them after kMostFavourites different ones.
class PosixSemaphore final : public ISemaphore {
 public:
  // As often has one thread to take the semaphore without another before it is the favourite.
  static constexpr std::uint32_t kTurnsToFavour = 64;
  static constexpr std::size_t kMostFavourites = 16;

  // Answers "PosixSemaphore" and "ISemaphore".
  void* ConvertTo(const char* name) override;

  // Draws the next number and waits, without limit, until it is called. Always 1. Any thread.
  int Lock() override;

  // Calls the next number. 1, or 0 when the semaphore was free, which then stays as it is. The
  // thread that took it.
  int Unlock() override;

  // How many threads have it or wait for it. A snapshot, for tests and diagnostics. Any thread.
  unsigned int UserCount() const;

  // Whether a thread is the favourite now. A snapshot, for tests and diagnostics. Any thread.
  bool HasFavourite() const { return favourite_.load() != nullptr; }

  // Tells the kernel that this process will ask for ordering on all processors. Cheap while the
  // process has one thread, so the earlier the better; done by the first semaphore at the latest.
  static void Prepare();

 private:
  static constexpr std::uint32_t kMostTurnsToFavour = std::uint32_t{1} << 24;

  // One thread's favour; belongs to that thread for good, which may look at it at any time, also
  // after another thread has become the favourite.
  struct Favour {
    std::atomic<std::uint32_t> thread{0};     // whose it is, 0 while it is nobody's
    std::atomic<std::uint32_t> ticket{0};     // the number that nobody has drawn while it lasts
    std::atomic<std::uint32_t> isHolding{0};  // 1 while the thread holds the semaphore by it
  };

  int LockByTicket();
  int QueueAsFavourite(Favour* favour);
  int UnlockByTicket();
  void Sleep(const std::atomic<std::uint32_t>& word, std::uint32_t seen, std::uint32_t bit);
  void Wake(const std::atomic<std::uint32_t>& word, std::uint32_t bit);
  void AwaitTurn(std::uint32_t ticket);
  void EndFavour();
  void NoteTurn(std::uint32_t thread);
  void Grant(std::uint32_t nextTicket);

  std::atomic<std::uint32_t> nextTicket_{0};
  std::atomic<std::uint32_t> nowServing_{0};
  std::atomic<std::uint32_t> sleepers_{0};  // threads that sleep in the kernel, or are about to

  // Set by the holder of a ticket as it lets go, cleared by the next holder of one.
  std::atomic<Favour*> favourite_{nullptr};

  // Of whoever holds the semaphore.
  Favour* heldFavour_ = nullptr;  // null when it is held by ticket
  std::uint32_t lastThread_ = 0;  // by ticket
  std::uint32_t turns_ = 0;
  std::uint32_t turnsToFavour_ = kTurnsToFavour;
  std::array<Favour, kMostFavourites> favours_;
};
