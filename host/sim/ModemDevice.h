// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <string>

#include "host/sim/Device.h"
#include "host/sim/DeviceSettings.h"

// A modem: commands that begin with AT and end with CR (LF is ignored), echoed as they come until
// ATE0, each answered with OK or ERROR. By itself it reports calls and messages in turn. Knows AT,
// ATE0, ATE1, ATI, ATZ, ATH, AT+CSQ and AT+CREG?. One thread.
class ModemDevice final : public Device {
 public:
  static constexpr std::size_t kMaxCommandBytes = 4096;

  explicit ModemDevice(DeviceSettings settings) : settings_(std::move(settings)) {}

  std::optional<DeviceMessage> NextMessage() override;
  DeviceAnswer OnBytes(std::string_view bytes) override;
  // A command ends with CR and nothing else.
  DeviceAnswer OnSilence() override { return {}; }

 private:
  void Echo(char byte, DeviceAnswer* answer) const;
  void OnCommand(const std::string& command, DeviceAnswer* answer);
  bool Obey(const std::string& command, DeviceAnswer* answer);
  DeviceMessage Framed(const char* what, const std::string& body) const;

  const DeviceSettings settings_;
  std::string command_;
  bool hasEcho_ = true;
  std::size_t next_ = 0;
};
