// SPDX-License-Identifier: Apache-2.0
#include "host/events/ClockWatch.h"

#include <cstdlib>
#include <ctime>

#include "host/base/Nanoseconds.h"
#include "host/events/WallClock.h"

namespace {

std::int64_t BootTimeUs() {
  timespec now{};
  (void)clock_gettime(CLOCK_BOOTTIME, &now);
  return static_cast<std::int64_t>(now.tv_sec) * kUsPerSecond + now.tv_nsec / kNsPerUs;
}

}  // namespace

std::string ClockWatch::Look() { return Look(WallClockUs(), BootTimeUs()); }

std::string ClockWatch::Look(std::int64_t timeOfDayUs, std::int64_t bootTimeUs) {
  const std::int64_t bootTimeOfDayUs = timeOfDayUs - bootTimeUs;
  const std::int64_t changeUs = bootTimeOfDayUs - bootTimeOfDayUs_.value_or(bootTimeOfDayUs);
  // Small steps do not add up to one that is told.
  bootTimeOfDayUs_ = bootTimeOfDayUs;
  if (std::abs(changeUs) < kUsPerSecond) {
    return "";
  }
  const std::int64_t seconds = (std::abs(changeUs) + kUsPerSecond / 2) / kUsPerSecond;
  return std::string("the clock of this machine was set ") + (changeUs < 0 ? "back" : "forward") +
         " by " + std::to_string(seconds) + " s; what is measured goes on, times of day do not";
}
