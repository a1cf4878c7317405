// SPDX-License-Identifier: Apache-2.0
#include "host/base/Deadline.h"

#include <poll.h>

#include <algorithm>
#include <cerrno>
#include <ctime>

namespace {

timespec ToTimespec(std::chrono::nanoseconds time) {
  const auto seconds = std::chrono::duration_cast<std::chrono::seconds>(time);
  timespec result{};
  result.tv_sec = static_cast<time_t>(seconds.count());
  result.tv_nsec = static_cast<decltype(result.tv_nsec)>((time - seconds).count());
  return result;
}

}  // namespace

Deadline Deadline::After(int timeoutMs) {
  return Deadline(std::chrono::steady_clock::now() +
                  std::chrono::milliseconds(std::max(timeoutMs, 0)));
}

bool Deadline::HasPassed() const { return std::chrono::steady_clock::now() >= at_; }

std::chrono::nanoseconds Deadline::Remaining() const {
  const auto left = at_ - std::chrono::steady_clock::now();
  return std::max<std::chrono::nanoseconds>(left, std::chrono::nanoseconds(0));
}

int Deadline::RemainingMs() const {
  return static_cast<int>(std::chrono::ceil<std::chrono::milliseconds>(Remaining()).count());
}

Deadline Deadline::Earlier(const Deadline& a, const Deadline& b) {
  return Deadline(std::min(a.at_, b.at_));
}

void Deadline::Sleep() const {
  const timespec until = ToTimespec(at_.time_since_epoch());
  while (clock_nanosleep(CLOCK_MONOTONIC, TIMER_ABSTIME, &until, nullptr) == EINTR) {
  }
}

int Deadline::Poll(struct pollfd* descriptors, unsigned int count) const {
  for (;;) {
    const timespec left = ToTimespec(Remaining());
    const int ready = ppoll(descriptors, count, &left, nullptr);
    if (ready >= 0 || errno != EINTR) {
      return ready;
    }
  }
}
