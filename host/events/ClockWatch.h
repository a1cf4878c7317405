// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <optional>
#include <string>

// Notices that somebody set the machine's time of day, by a clock that cannot be set. Time stamps
// in front of that moment and behind it cannot be compared. Not for several threads at once.
class ClockWatch {
 public:
  // Both at the same moment, microseconds: the time of day, and CLOCK_BOOTTIME (clock_gettime(2)),
  // which goes on while the machine sleeps. Returns what to tell people when the time of day was
  // changed by a second or more since the last look, otherwise nothing. Smaller steps are how a
  // clock is kept right.
  std::string Look(std::int64_t timeOfDayUs, std::int64_t bootTimeUs);

  // The same with what the clocks say now.
  std::string Look();

 private:
  std::optional<std::int64_t> bootTimeOfDayUs_;  // the time of day at which the machine was booted
};
