// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

#include "host/framing/FramingSettings.h"

// Configurations in words. All functions: any thread.

// How received bytes are cut: "rx 02…03  gap 0 (500 ms)"; "rx by silence" without prefix and
// suffix.
std::string ReceivingText(const FramingSettings& settings);

// A configuration on one line, as in "com1 9600 7E1 RS-232  rx 02…03  tx …0D0A  gap 0 (500 ms)
// queue 100". The first part is read from `comParams`, the driver's own list of port, rate, parity,
// data bits, stop bits and mode with commas between; where that is not such a list, from the text.
std::string ConfigLine(const std::string& configuration, const std::string& comParams);

// What is legal in a configuration and probably not meant, and what is easily overlooked: keys that
// nobody reads, numbers that are read differently than they look, values that the driver takes but
// does not offer, and what the gap does to tokens. One entry a line.
std::vector<std::string> ConfigNotes(const std::string& configuration);

// Every key on a line with its value, where that comes from, what is allowed and what it means.
std::vector<std::string> ConfigTable(const std::string& configuration);
