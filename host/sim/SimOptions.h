// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include "host/sim/DeviceSettings.h"
#include "host/sim/FaultOptions.h"

// What the command line says about a simulated device.
struct SimOptions {
  static constexpr int kDefaultUnplugForMs = 2000;

  std::string kind;                   // name of a DeviceKind
  std::string linkPath;               // empty: no link
  std::optional<std::string> prefix;  // instead of the kind's own
  std::optional<std::string> suffix;
  DeviceSettings device;  // its framing is filled in from the kind and the two above
  FaultOptions faults;
  std::optional<int> everyMs;  // instead of the kind's own; 0: only when asked
  int burst = 1;               // messages at each interval
  std::uint64_t count = 0;     // ends behind so many messages; 0: no end
  int forMs = 0;               // ends after this time; 0: no end
  int unplugEveryMs = 0;       // 0: never
  int unplugForMs = kDefaultUnplugForMs;
  bool isJson = false;
};
