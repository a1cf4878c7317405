// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "host/sim/DeviceMessage.h"

// What a simulated device is made from.
struct DeviceSettings {
  DeviceFraming framing;
  // Bodies to send in turn instead of the device's own; empty: its own.
  std::vector<std::string> texts;
  std::uint64_t seed = 1;
  int driftGrams = 0;     // scale: most that the weight moves between two messages
  bool isBinary = false;  // rfid: the number as bytes instead of digits
};
