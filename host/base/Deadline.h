// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <chrono>

struct pollfd;

// A point on the monotonic clock (CLOCK_MONOTONIC, which no clock change moves) up to which a call
// may wait. Interrupted and partial waits are handled here once. Any thread; each object is used by
// one thread at a time.
class Deadline {
 public:
  // The deadline that lies timeoutMs milliseconds ahead; a negative time-out counts as 0.
  static Deadline After(int timeoutMs);

  // The deadline at this point in time.
  static Deadline At(std::chrono::steady_clock::time_point at) { return Deadline(at); }

  bool HasPassed() const;

  // Time that is left; zero once the deadline has passed.
  std::chrono::nanoseconds Remaining() const;

  // The same in milliseconds, rounded up, so that a wait of that length never ends early.
  int RemainingMs() const;

  // The one that comes first.
  static Deadline Earlier(const Deadline& a, const Deadline& b);

  // Sleeps until the deadline (clock_nanosleep(2) with an absolute time, begun again after EINTR).
  void Sleep() const;

  // Waits until one of `count` descriptors is ready or the deadline has passed (ppoll(2), begun
  // again after EINTR with what is left). Returns the number of descriptors that are ready, 0 when
  // the time is over, -1 with errno on any other error.
  int Poll(struct pollfd* descriptors, unsigned int count) const;

 private:
  explicit Deadline(std::chrono::steady_clock::time_point at) : at_(at) {}

  std::chrono::steady_clock::time_point at_;
};
