// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <cstddef>

#include "host/sim/CommandDevice.h"

// An RFID reader: the number of each card in front of it, five bytes and a check byte (all five,
// exclusive or), as hexadecimal digits or as the bytes themselves. The four cards depend on the
// seed; one is held to the reader twice in a row. It takes no commands. One thread.
class RfidDevice final : public CommandDevice {
 public:
  explicit RfidDevice(const DeviceSettings& settings);

 private:
  const char* What() const override { return "card"; }
  std::string NextBody() override;
  std::string Obey(const std::string& command, DeviceAnswer* answer) override;

  std::array<std::string, 4> cards_;
  std::size_t next_ = 0;
};
