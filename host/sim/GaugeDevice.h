// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "host/sim/CommandDevice.h"
#include "host/sim/SimRandom.h"

// A measuring gauge: "+12.345 mm", a few micrometres up and down with the seed. M? or ? asks for a
// new value. One thread.
class GaugeDevice final : public CommandDevice {
 public:
  explicit GaugeDevice(const DeviceSettings& settings);

 private:
  const char* What() const override { return "value"; }
  std::string NextBody() override;
  std::string Obey(const std::string& command, DeviceAnswer* answer) override;

  SimRandom random_;
};
