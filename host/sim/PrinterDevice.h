// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <string>

#include "host/sim/Device.h"
#include "host/sim/DeviceSettings.h"

// A label printer: everything up to and with FF (0C), ETX or "^XZ" is one label. ENQ (05) asks for
// the status at any time and is no label data; the answer is "READY,n", n labels printed so far.
// One thread.
class PrinterDevice final : public Device {
 public:
  // A label that is longer is taken for several.
  static constexpr std::size_t kMaxLabelBytes = 65536;

  explicit PrinterDevice(DeviceSettings settings) : settings_(std::move(settings)) {}

  // Only texts that were asked for; a printer says nothing by itself.
  std::optional<DeviceMessage> NextMessage() override;
  DeviceAnswer OnBytes(std::string_view bytes) override;
  DeviceAnswer OnSilence() override { return {}; }

 private:
  bool IsLabelEnd() const;

  const DeviceSettings settings_;
  std::string label_;
  std::size_t labels_ = 0;
  std::size_t nextText_ = 0;
};
