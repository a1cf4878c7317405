// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include "host/framing/FramingSettings.h"
#include "host/instance/SettingsBook.h"

// The framing that the receive task of a driver works with. The driver does not show it: its tags
// show what is staged or applied, while its console changes what is in effect and nothing else. So
// the host follows both. One thread at a time.
class FramingInEffect {
 public:
  const FramingSettings& Settings() const { return settings_; }

  // The driver was started or has applied its settings: what the tags show is in effect.
  void OnApplied(const SettingsBook& book);

  // The driver has carried out a console command and answered.
  void OnConsole(const std::string& line, const std::string& reply);

 private:
  FramingSettings settings_;
};
