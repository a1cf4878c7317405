// SPDX-License-Identifier: Apache-2.0
#include "host/commands/StoreJson.h"

#include <cstdint>
#include <limits>
#include <nlohmann/json.hpp>

#include "host/instance/SettingTable.h"
#include "host/text/ByteText.h"
#include "host/text/Utf8Text.h"

namespace {

using Json = nlohmann::json;

constexpr const char* kHexKey = "hex";
constexpr int kIndent = 2;

// Key spaces and keys are texts of the driver; the JSON text must be UTF-8 in any case.
Json JsonOf(const StoredValue& value) {
  if (const auto* const text = std::get_if<std::string>(&value)) {
    return IsUtf8(*text) ? Json(*text) : Json{{kHexKey, CompactHex(*text)}};
  }
  if (const auto* const flag = std::get_if<bool>(&value)) {
    return *flag;
  }
  return std::get<int>(value);
}

bool IsHexObject(const Json& json) {
  return json.is_object() && json.size() == 1 && json.contains(kHexKey) &&
         json[kHexKey].is_string();
}

bool ValueOf(const Json& json, StoredValue* value) {
  if (json.is_boolean()) {
    *value = json.get<bool>();
    return true;
  }
  if (json.is_number_integer()) {
    const bool isTooLarge = json.is_number_unsigned() &&
                            json.get<std::uint64_t>() > std::numeric_limits<std::int32_t>::max();
    if (isTooLarge || json.get<std::int64_t>() < std::numeric_limits<std::int32_t>::min()) {
      return false;
    }
    *value = json.get<int>();
    return true;
  }
  std::string text;
  if (json.is_string()) {
    text = json.get<std::string>();
  } else if (!IsHexObject(json) || !ParseHexBytes(json[kHexKey].get<std::string>(), &text)) {
    return false;
  }
  // The driver's texts end at a zero byte.
  const bool isWhole = text.find('\0') == std::string::npos;
  *value = std::move(text);
  return isWhole;
}

const char* KindName(SettingForm form) {
  return form == SettingForm::kBoolean   ? "true or false"
         : form == SettingForm::kHexText ? "a text of hexadecimal digits"
                                         : "a number";
}

bool HasItsKind(const SettingEntry& setting, const StoredValue& value) {
  switch (setting.form) {
    case SettingForm::kBoolean:
      return std::holds_alternative<bool>(value);
    case SettingForm::kHexText:
      return std::holds_alternative<std::string>(value);
    default:
      return std::holds_alternative<int>(value);
  }
}

bool ParseSpace(const std::string& ident, const Json& space, SqliteFile::Values* values,
                std::string* error) {
  if (!space.is_object()) {
    *error = "\"" + ident + "\" holds no object of settings";
    return false;
  }
  for (const auto& [key, json] : space.items()) {
    StoredValue value;
    const SettingEntry* const setting = FindSetting(key);
    if (!ValueOf(json, &value)) {
      error->assign(key).append(" of ").append(ident);
      error->append(" is no number of 32 bits, no boolean and no text");
      return false;
    }
    if (setting != nullptr && key == setting->key && !HasItsKind(*setting, value)) {
      error->assign(key).append(" of ").append(ident);
      error->append(" must be ").append(KindName(setting->form));
      return false;
    }
    (*values)[{ident, key}] = std::move(value);
  }
  return true;
}

}  // namespace

std::string StoreJson(const SqliteFile::Values& values) {
  Json json = Json::object();
  for (const auto& [key, value] : values) {
    json[key.first][key.second] = JsonOf(value);
  }
  return json.dump(kIndent, ' ', true, Json::error_handler_t::strict) + "\n";
}

bool ParseStoreJson(const std::string& text, SqliteFile::Values* values, std::string* error) {
  const Json json = Json::parse(text, nullptr, false);
  if (!json.is_object()) {
    *error = "expected a JSON object of key spaces, as loka store export writes it";
    return false;
  }
  SqliteFile::Values read;
  for (const auto& [ident, space] : json.items()) {
    if (!ParseSpace(ident, space, &read, error)) {
      return false;
    }
  }
  *values = std::move(read);
  return true;
}
