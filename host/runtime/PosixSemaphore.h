// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <atomic>
#include <cstdint>

#include "interfaces/ISemaphore.h"

// A host semaphore that serves strictly first come, first served: a ticket lock whose waiters sleep
// in the kernel (futex(2)). The receive task takes its semaphore again right after letting it go; a
// lock without an order could make everybody else wait for good. Without contention neither
// operation makes a system call. Not recursive.
class PosixSemaphore final : public ISemaphore {
 public:
  // Answers "PosixSemaphore" and "ISemaphore".
  void* ConvertTo(const char* name) override;

  // Draws the next number and waits, without limit, until it is called. Always 1. Any thread.
  int Lock() override;

  // Calls the next number. 1, or 0 when the semaphore was free, which then stays as it is. The
  // thread that took it.
  int Unlock() override;

  // How many threads have it or wait for it. A snapshot, for tests and diagnostics. Any thread.
  unsigned int UserCount() const;

 private:
  std::atomic<std::uint32_t> nextTicket_{0};
  std::atomic<std::uint32_t> nowServing_{0};
};
