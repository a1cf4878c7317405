// SPDX-License-Identifier: Apache-2.0
#include "host/port/ArrivalClock.h"

#include <algorithm>

std::int64_t ArrivalClock::DeadlineNs(std::int64_t nowNs, std::int64_t timeoutNs) {
  const bool wasAway = isSilent_ && startNs_ + timeoutNs <= nowNs;
  if (!hasStarted_ || wasAway) {
    startNs_ = nowNs;
    hasStarted_ = true;
  }
  return startNs_ + timeoutNs;
}

void ArrivalClock::Gave(std::int64_t arrivedNs) {
  // Also when that lies before the end of a time-out which was answered late.
  startNs_ = arrivedNs;
  hasStarted_ = true;
  isSilent_ = false;
}

void ArrivalClock::TimedOut(std::int64_t endNs) {
  startNs_ = std::max(startNs_, endNs);
  hasStarted_ = true;
  isSilent_ = true;
}

std::int64_t ArrivalClock::BelatedArrivalNs(std::int64_t foundNs, std::int64_t deadlineNs,
                                            std::int64_t timeoutNs) {
  return foundNs - deadlineNs <= timeoutNs / 2 ? std::min(foundNs, deadlineNs) : foundNs;
}
