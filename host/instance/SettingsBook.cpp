// SPDX-License-Identifier: Apache-2.0
#include "host/instance/SettingsBook.h"

#include <cstddef>

#include "host/framing/ConfigText.h"

SettingsBook::SettingsBook(const std::string& configuration) {
  for (const SettingEntry& setting : kSettingTable) {
    Of(setting).configured =
        ShowConfigured(setting, ConfigValue(configuration, setting.configKey, setting.fallback));
  }
}

SettingsBook::Row& SettingsBook::Of(const SettingEntry& setting) {
  return rows_[static_cast<std::size_t>(&setting - kSettingTable.data())];
}

const SettingsBook::Row& SettingsBook::Of(const SettingEntry& setting) const {
  return rows_[static_cast<std::size_t>(&setting - kSettingTable.data())];
}
