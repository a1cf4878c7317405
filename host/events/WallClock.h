// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <string>

// Time of day, for people and for records; never for measuring. All functions: any thread.

inline constexpr std::int64_t kUsPerSecond = 1'000'000;

// Microseconds since 1970-01-01 UTC.
std::int64_t WallClockUs();

// "2026-11-21T09:12:03.123456Z".
std::string UtcText(std::int64_t timeUs);

// "09:12:03.123" in the time zone of the machine.
std::string LocalTimeText(std::int64_t timeUs);

// Reads what UtcText writes. False for anything else.
bool ParseUtcText(const std::string& text, std::int64_t* timeUs);
