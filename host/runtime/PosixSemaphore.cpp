// SPDX-License-Identifier: Apache-2.0
#include "host/runtime/PosixSemaphore.h"

#include <linux/futex.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <climits>

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

static_assert(sizeof(std::atomic<std::uint32_t>) == sizeof(std::uint32_t),
              "the kernel waits on the number itself");

}  // namespace

void* PosixSemaphore::ConvertTo(const char* name) {
  const bool isOurs =
      CompareInterface(name, "PosixSemaphore") || CompareInterface(name, "ISemaphore");
  return isOurs ? this : nullptr;
}

int PosixSemaphore::Lock() {
  const std::uint32_t ticket = nextTicket_.fetch_add(1);
  for (;;) {
    const std::uint32_t serving = nowServing_.load();
    if (serving == ticket) {
      return 1;
    }
    FutexWait(&nowServing_, serving, WakeBit(ticket));
  }
}

int PosixSemaphore::Unlock() {
  const std::uint32_t serving = nowServing_.load();
  if (nextTicket_.load() == serving) {
    return 0;
  }
  // Sequentially consistent on purpose: a thread that draws a number after the check below must see
  // the new turn, or it would sleep with nobody left to wake it.
  nowServing_.store(serving + 1);
  if (nextTicket_.load() != serving + 1) {
    FutexWake(&nowServing_, WakeBit(serving + 1));
  }
  return 1;
}

unsigned int PosixSemaphore::UserCount() const { return nextTicket_.load() - nowServing_.load(); }
