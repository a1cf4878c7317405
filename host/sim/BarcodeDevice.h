// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>

#include "host/sim/CommandDevice.h"

// A barcode scanner: codes of a short list in turn, among them the same one twice in a row and a
// GS1 code with the separator GS (1D) inside. T triggers the next scan. One thread.
class BarcodeDevice final : public CommandDevice {
 public:
  explicit BarcodeDevice(const DeviceSettings& settings) : CommandDevice(settings) {}

 private:
  const char* What() const override { return "code"; }
  std::string NextBody() override;
  std::string Obey(const std::string& command, DeviceAnswer* answer) override;

  std::size_t next_ = 0;
};
