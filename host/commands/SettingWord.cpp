// SPDX-License-Identifier: Apache-2.0
#include "host/commands/SettingWord.h"

#include <cstdint>
#include <cstdlib>

#include "host/framing/ControlNames.h"
#include "host/text/ByteText.h"

namespace {

bool ParseBytes(const SettingEntry& entry, const std::string& text, std::string* hexText,
                std::string* error) {
  std::string bytes;
  if (!ParseControlText(text, &bytes, error)) {
    *error = std::string(entry.key) + ": " + *error;
    return false;
  }
  *hexText = bytes.empty() ? "none" : CompactHex(bytes);
  return true;
}

}  // namespace

bool ParseSettingWord(const std::string& word, SettingWord* setting, std::string* error) {
  const std::size_t equals = word.find('=');
  if (equals == std::string::npos) {
    *error = "expected KEY=VALUE, not \"" + word + "\"";
    return false;
  }
  const std::string key = word.substr(0, equals);
  const std::string value = word.substr(equals + 1);
  setting->entry = FindSetting(key);
  if (setting->entry == nullptr) {
    *error = "no setting \"" + key + "\"; there are " + SettingNames();
    return false;
  }
  return setting->entry->form == SettingForm::kHexText
             ? ParseBytes(*setting->entry, value, &setting->tagValue, error)
             : ParseSetting(*setting->entry, value, &setting->tagValue, error);
}

StoredValue StoredValueOf(const SettingWord& setting) {
  switch (setting.entry->form) {
    case SettingForm::kHexText:
      return setting.tagValue;
    case SettingForm::kBoolean:
      return setting.tagValue != "0";
    default:
      break;
  }
  return static_cast<int>(std::strtol(setting.tagValue.c_str(), nullptr, 10));
}
