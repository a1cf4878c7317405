// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <optional>
#include <string>

#include "host/instance/SettingTable.h"

// What the host knows about each setting of a running driver: configured, active, staged. A read of
// the driver's tag shows the staged value while there is one, so the active one is remembered here.
// Values as ShowSetting writes them. One thread at a time.
class SettingsBook {
 public:
  struct Row {
    std::string configured;
    std::string active;
    std::optional<std::string> staged;
  };

  explicit SettingsBook(const std::string& configuration);

  // The row of a setting of kSettingTable.
  Row& Of(const SettingEntry& setting);
  const Row& Of(const SettingEntry& setting) const;

 private:
  std::array<Row, kSettingTable.size()> rows_;
};
