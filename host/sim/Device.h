// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <optional>
#include <string_view>

#include "host/sim/DeviceMessage.h"

// A simulated serial device: what it says and how it answers. It knows nothing of ports, time and
// faults. One thread.
class Device {
 public:
  virtual ~Device() = default;

  // The message that is due when the interval has passed; nothing when the device does not speak
  // unasked.
  virtual std::optional<DeviceMessage> NextMessage() = 0;

  // Takes bytes from the line, in pieces of any size.
  virtual DeviceAnswer OnBytes(std::string_view bytes) = 0;

  // Called once when nothing has come for a while behind the last byte; it ends a command that has
  // no other end.
  virtual DeviceAnswer OnSilence() = 0;
};
