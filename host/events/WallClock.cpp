// SPDX-License-Identifier: Apache-2.0
#include "host/events/WallClock.h"

#include <sys/time.h>

#include <array>
#include <cstdio>
#include <cstdlib>
#include <ctime>

namespace {

// Rounds down also in front of 1970, so that the rest is never negative.
std::int64_t SecondsOf(std::int64_t timeUs) {
  const std::int64_t seconds = timeUs / kUsPerSecond;
  return timeUs % kUsPerSecond < 0 ? seconds - 1 : seconds;
}

}  // namespace

std::int64_t WallClockUs() {
  timeval now{};
  (void)gettimeofday(&now, nullptr);
  return static_cast<std::int64_t>(now.tv_sec) * kUsPerSecond + now.tv_usec;
}

std::string UtcText(std::int64_t timeUs) {
  const auto seconds = static_cast<std::time_t>(SecondsOf(timeUs));
  const auto restUs = static_cast<long>(timeUs - SecondsOf(timeUs) * kUsPerSecond);
  tm utc{};
  (void)gmtime_r(&seconds, &utc);
  std::array<char, 64> text{};
  (void)std::snprintf(text.data(), text.size(), "%04d-%02d-%02dT%02d:%02d:%02d.%06ldZ",
                      utc.tm_year + 1900, utc.tm_mon + 1, utc.tm_mday, utc.tm_hour, utc.tm_min,
                      utc.tm_sec, restUs);
  return text.data();
}

std::string LocalTimeText(std::int64_t timeUs) {
  const auto seconds = static_cast<std::time_t>(SecondsOf(timeUs));
  const auto restMs = static_cast<long>((timeUs - SecondsOf(timeUs) * kUsPerSecond) / 1000);
  tm local{};
  (void)localtime_r(&seconds, &local);
  std::array<char, 64> text{};
  (void)std::snprintf(text.data(), text.size(), "%02d:%02d:%02d.%03ld", local.tm_hour, local.tm_min,
                      local.tm_sec, restMs);
  return text.data();
}

bool ParseUtcText(const std::string& text, std::int64_t* timeUs) {
  tm utc{};
  // The part behind the point is read on its own: strptime(3) knows no fractions.
  const char* const point = strptime(text.c_str(), "%Y-%m-%dT%H:%M:%S", &utc);
  if (point == nullptr || *point != '.') {
    return false;
  }
  const long restUs = std::strtol(point + 1, nullptr, 10);
  const std::int64_t parsed = static_cast<std::int64_t>(timegm(&utc)) * kUsPerSecond + restUs;
  // Only one way to write a moment is taken: no missing digits, no 31st of November.
  if (UtcText(parsed) != text) {
    return false;
  }
  *timeUs = parsed;
  return true;
}
