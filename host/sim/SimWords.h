// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <string>
#include <string_view>

#include "host/sim/FaultOptions.h"

// The words in which times, rates and texts are given to the simulators. Each function returns
// false, with its outputs untouched, for a word that is not right. Any thread.

// "250ms", "2s", "1.5s", or a plain number in units of unitMs milliseconds. At most a day.
bool ParseTimeMs(std::string_view word, int unitMs, int* timeMs);

// "5", "5%", "0.5%": 0 to 100.
bool ParsePercent(std::string_view word, double* percent);

// How messages are split: "3" pieces 20 ms apart, "50ms" for two pieces with that pause, "3@50ms".
bool ParseSplit(std::string_view word, FaultOptions* options);

// Bodies that are too long: "1200" bytes for each message, "1200@5%" for some.
bool ParseTooLong(std::string_view word, FaultOptions* options);

// A text with the escapes \xNN, \r, \n, \t, \0 and \\.
bool ParseEscapedText(std::string_view word, std::string* text);
