// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <string>

#include "host/sim/CommandCollector.h"
#include "host/sim/Device.h"
#include "host/sim/DeviceSettings.h"

// A device that sends framed bodies and takes commands that end with CR, LF, ETX or a silence. What
// the bodies and commands are is left to each kind. One thread.
class CommandDevice : public Device {
 public:
  explicit CommandDevice(DeviceSettings settings) : settings_(std::move(settings)) {}

  std::optional<DeviceMessage> NextMessage() override;
  DeviceAnswer OnBytes(std::string_view bytes) override;
  DeviceAnswer OnSilence() override;

 protected:
  const DeviceSettings& Settings() const { return settings_; }

  // The next of the texts to send instead of the device's own bodies, or the device's own.
  std::string NextText();

  DeviceMessage Framed(const std::string& what, const std::string& body) const;

  // Answers with the next text.
  void AnswerWithNext(const std::string& what, DeviceAnswer* answer);

 private:
  // What a message of this device is called in reports.
  virtual const char* What() const = 0;

  // The body that is due next.
  virtual std::string NextBody() = 0;

  // Adds what a command comes to, upper case and without blanks around it. Returns what the device
  // takes it for; empty when it means nothing to it.
  virtual std::string Obey(const std::string& command, DeviceAnswer* answer) = 0;

  void OnCommand(const std::string& command, DeviceAnswer* answer);

  const DeviceSettings settings_;
  CommandCollector collector_;
  std::size_t nextText_ = 0;
};
