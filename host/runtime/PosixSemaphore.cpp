// SPDX-License-Identifier: Apache-2.0
#include "host/runtime/PosixSemaphore.h"

#include <linux/futex.h>
#include <linux/membarrier.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <climits>
#include <thread>

#include "interfaces/CompareInterface.h"

namespace {

// One wake-up bit a ticket, so that a call wakes the thread whose turn it is and nobody else (up to
// 32 waiters; beyond that a thread may wake in vain and sleep again).
std::uint32_t WakeBit(std::uint32_t ticket) { return std::uint32_t{1} << (ticket % 32U); }

void FutexWait(const std::atomic<std::uint32_t>* word, std::uint32_t seen, std::uint32_t bit) {
  // An early return (EINTR, EAGAIN) is harmless: the caller looks at the word again.
  (void)syscall(SYS_futex, word, FUTEX_WAIT_BITSET | FUTEX_PRIVATE_FLAG, seen, nullptr, nullptr,
                bit);
}

void FutexWake(const std::atomic<std::uint32_t>* word, std::uint32_t bit) {
  (void)syscall(SYS_futex, word, FUTEX_WAKE_BITSET | FUTEX_PRIVATE_FLAG, INT_MAX, nullptr, nullptr,
                bit);
}

constexpr std::uint32_t kEveryBit = FUTEX_BITSET_MATCH_ANY;

// What most holders do with the semaphore is over sooner than a thread falls asleep and is woken;
// with only one processor the holder could not go on meanwhile.
int LooksBeforeSleep() {
  constexpr int kLooks = 200;  // some microseconds
  static const int looks = std::thread::hardware_concurrency() > 1 ? kLooks : 0;
  return looks;
}

// Tells the processor that this is a waiting loop.
void Relax() {
#if defined(__x86_64__) || defined(__i386__)
  __builtin_ia32_pause();
#elif defined(__aarch64__)
  __asm__ volatile("yield");
#endif
}

// Whether the word changes to a value that the caller waits for within those microseconds.
template <typename IsThere>
bool LooksFor(const std::atomic<std::uint32_t>& word, IsThere isThere) {
  for (int left = LooksBeforeSleep(); left > 0; --left) {
    if (isThere(word.load(std::memory_order_acquire))) {
      return true;
    }
    Relax();
  }
  return false;
}

bool RegisterBarrier() {
  return syscall(SYS_membarrier, MEMBARRIER_CMD_REGISTER_PRIVATE_EXPEDITED, 0, 0) == 0;
}

// Whether the kernel orders memory accesses on all processors for us.
bool HasBarrier() {
  static const bool hasBarrier = RegisterBarrier();
  return hasBarrier;
}

// Every thread of the process has behind it, in order, what stands in front of it in its code.
void OrderEverywhere() { (void)syscall(SYS_membarrier, MEMBARRIER_CMD_PRIVATE_EXPEDITED, 0, 0); }

// The other half of it, in the thread that is ordered: keeps the compiler from changing the order.
void KeepOrder() { std::atomic_signal_fence(std::memory_order_seq_cst); }

// A number of its own for each thread, never used again; 0 until it takes its first semaphore. Part
// of the program itself, so that no call is needed to find it.
[[gnu::tls_model("initial-exec")]] thread_local std::uint32_t thisThread = 0;

void NumberThisThread() {
  static std::atomic<std::uint32_t> lastThread{0};
  if (thisThread == 0) {
    thisThread = lastThread.fetch_add(1) + 1;
  }
}

static_assert(sizeof(std::atomic<std::uint32_t>) == sizeof(std::uint32_t),
              "the kernel waits on the number itself");

}  // namespace

void PosixSemaphore::Prepare() { (void)HasBarrier(); }

void* PosixSemaphore::ConvertTo(const char* name) {
  const bool isOurs =
      CompareInterface(name, "PosixSemaphore") || CompareInterface(name, "ISemaphore");
  return isOurs ? this : nullptr;
}

// The favourite's way, taken for every received byte. A thread without a number is nobody's
// favourite.
int PosixSemaphore::Lock() {
  Favour* const favour = favourite_.load(std::memory_order_acquire);
  if (favour == nullptr || favour->thread.load(std::memory_order_relaxed) != thisThread) {
    return LockByTicket();
  }
  favour->isHolding.store(1, std::memory_order_relaxed);
  KeepOrder();
  if (nextTicket_.load(std::memory_order_acquire) !=
      favour->ticket.load(std::memory_order_relaxed)) {
    return QueueAsFavourite(favour);
  }
  heldFavour_ = favour;
  return 1;
}

// Somebody has drawn a number and may be waiting for the favourite.
[[gnu::noinline]] int PosixSemaphore::QueueAsFavourite(Favour* favour) {
  favour->isHolding.store(0);
  Wake(favour->isHolding, kEveryBit);
  return LockByTicket();
}

int PosixSemaphore::LockByTicket() {
  NumberThisThread();
  AwaitTurn(nextTicket_.fetch_add(1));
  EndFavour();
  NoteTurn(thisThread);
  return 1;
}

// Sleeps while the word has the value that was seen in it.
void PosixSemaphore::Sleep(const std::atomic<std::uint32_t>& word, std::uint32_t seen,
                           std::uint32_t bit) {
  sleepers_.fetch_add(1);
  FutexWait(&word, seen, bit);
  sleepers_.fetch_sub(1);
}

// Behind a change of the word that is ordered before the look at the sleepers: whoever is not among
// them yet will see the change before it falls asleep. Most who wait only look. Never part of its
// callers, whose usual way has no call in it.
[[gnu::noinline]] void PosixSemaphore::Wake(const std::atomic<std::uint32_t>& word,
                                            std::uint32_t bit) {
  if (sleepers_.load() != 0) {
    FutexWake(&word, bit);
  }
}

void PosixSemaphore::AwaitTurn(std::uint32_t ticket) {
  for (;;) {
    const std::uint32_t serving = nowServing_.load();
    if (serving == ticket) {
      return;
    }
    const bool isNext = serving + 1 == ticket;
    if (isNext && LooksFor(nowServing_, [=](std::uint32_t now) { return now == ticket; })) {
      return;
    }
    Sleep(nowServing_, serving, WakeBit(ticket));
  }
}

// The caller has the ticket that is served. The favourite either sees that it was drawn, or has
// said before that it holds the semaphore.
void PosixSemaphore::EndFavour() {
  Favour* const favour = favourite_.load();
  if (favour == nullptr) {
    return;
  }
  OrderEverywhere();
  while (favour->isHolding.load(std::memory_order_acquire) != 0) {
    if (LooksFor(favour->isHolding, [](std::uint32_t isHolding) { return isHolding == 0; })) {
      break;
    }
    Sleep(favour->isHolding, 1, kEveryBit);
  }
  favourite_.store(nullptr);
  if (turnsToFavour_ < kMostTurnsToFavour) {
    turnsToFavour_ *= 2;
  }
}

void PosixSemaphore::NoteTurn(std::uint32_t thread) {
  if (lastThread_ != thread) {
    lastThread_ = thread;
    turns_ = 0;
  }
  ++turns_;
}

// Makes the thread of the last turns the favourite. A number that is drawn from now on is served
// behind its turn and ends the favour.
void PosixSemaphore::Grant(std::uint32_t nextTicket) {
  for (Favour& favour : favours_) {
    const std::uint32_t thread = favour.thread.load(std::memory_order_relaxed);
    if (thread == 0 || thread == lastThread_) {
      favour.thread.store(lastThread_, std::memory_order_relaxed);
      favour.ticket.store(nextTicket, std::memory_order_relaxed);
      favourite_.store(&favour);
      return;
    }
  }
}

// The favourite's way again.
int PosixSemaphore::Unlock() {
  Favour* const favour = heldFavour_;
  if (favour == nullptr) {
    return UnlockByTicket();
  }
  heldFavour_ = nullptr;
  const std::uint32_t ticket = favour->ticket.load(std::memory_order_relaxed);
  favour->isHolding.store(0, std::memory_order_release);
  KeepOrder();
  if (nextTicket_.load(std::memory_order_relaxed) != ticket) {
    std::atomic_thread_fence(std::memory_order_seq_cst);
    Wake(favour->isHolding, kEveryBit);
  }
  return 1;
}

int PosixSemaphore::UnlockByTicket() {
  const std::uint32_t serving = nowServing_.load();
  if (nextTicket_.load() == serving) {
    return 0;
  }
  if (turns_ >= turnsToFavour_ && nextTicket_.load() == serving + 1 && HasBarrier()) {
    Grant(serving + 1);
  }
  // Sequentially consistent on purpose: a thread that draws a number after the check below must see
  // the new turn, or it would sleep with nobody left to wake it.
  nowServing_.store(serving + 1);
  if (nextTicket_.load() != serving + 1) {
    Wake(nowServing_, WakeBit(serving + 1));
  }
  return 1;
}

unsigned int PosixSemaphore::UserCount() const {
  const Favour* const favour = favourite_.load();
  return nextTicket_.load() - nowServing_.load() +
         (favour == nullptr ? 0 : favour->isHolding.load());
}
