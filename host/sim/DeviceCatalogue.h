// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <memory>
#include <string>
#include <vector>

#include "host/port/LineSettings.h"
#include "host/sim/Device.h"
#include "host/sim/DeviceSettings.h"

// One kind of simulated device with what is usual for it.
struct DeviceKind {
  const char* name = "";
  const char* summary = "";      // one line
  const char* description = "";  // what it sends and what it answers, for the help
  DeviceFraming framing;
  int everyMs = 0;  // between two messages; 0: speaks only when it is asked
  LineSettings line;
  DeviceFraming commands;  // what a host should put around what it sends
  int gapMs = 0;           // the gap that suits a host, 0 for the usual one
  std::unique_ptr<Device> (*make)(const DeviceSettings& settings) = nullptr;
};

// All kinds, in the order of the help. Any thread.
const std::vector<DeviceKind>& DeviceKinds();

// How a host is configured for a device with these settings: a configuration text, and the same as
// arguments of "loka config new". Any thread.
std::string ConfigurationFor(const DeviceKind& kind, const DeviceSettings& settings);
std::string ConfigArgumentsFor(const DeviceKind& kind, const DeviceSettings& settings);
