// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "host/sim/CommandDevice.h"
#include "host/sim/SimRandom.h"

// A scale: "ST,GS+  5.12kg". ST is stable and US moving, GS gross and NT net. R or SI asks for the
// weight, Z sets it to zero, T tares; Z and T are answered with "OK", anything else not at all.
// Without drift the weight stays the same; with it, it moves by a random amount up to the drift
// from one message to the next. One thread.
class ScaleDevice final : public CommandDevice {
 public:
  explicit ScaleDevice(const DeviceSettings& settings);

 private:
  const char* What() const override { return "weight"; }
  std::string NextBody() override;
  std::string Obey(const std::string& command, DeviceAnswer* answer) override;

  std::string Display() const;

  SimRandom random_;
  int loadGrams_ = 5120;
  int zeroGrams_ = 0;
  int tareGrams_ = 0;
  bool isMoving_ = false;
};
