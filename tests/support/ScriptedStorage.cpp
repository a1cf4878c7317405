// SPDX-License-Identifier: Apache-2.0
#include "tests/support/ScriptedStorage.h"

#include <cstring>

#include "interfaces/CompareInterface.h"
#include "tests/support/HostCall.h"

namespace {

std::string Address(const char* ident, const char* key) {
  return std::string(" ") + (ident != nullptr ? ident : "(null)") + " " +
         (key != nullptr ? key : "(null)");
}

std::string Text(const char* text) { return text != nullptr ? text : ""; }

}  // namespace

void* ScriptedStorage::ConvertTo(const char* name) {
  const HostCall inside;
  const bool plain = CompareInterface(name, "IPermanentStorage");
  const bool extended =
      CompareInterface(name, "IPermanentStorage2") && extended_ && !faults_.IsToFail("ConvertTo");
  log_.Add("ConvertTo " + Text(name) + (plain || extended ? " -> 1" : " -> 0"));
  return plain || extended ? this : nullptr;
}

void ScriptedStorage::Store(const char* ident, const char* key, Value value) {
  const std::lock_guard<std::mutex> guard(mutex_);
  values_[{Text(ident), Text(key)}] = std::move(value);
}

void ScriptedStorage::SetString(const char* ident, const char* key, const char* text) {
  const HostCall inside;
  log_.Add("SetString" + Address(ident, key) + " " + Text(text));
  Store(ident, key, {Value::Type::kString, false, 0, Text(text)});
}

void ScriptedStorage::SetBoolean(const char* ident, const char* key, bool value) {
  const HostCall inside;
  log_.Add("SetBoolean" + Address(ident, key) + (value ? " true" : " false"));
  Store(ident, key, {Value::Type::kBoolean, value, 0, ""});
}

void ScriptedStorage::SetInteger(const char* ident, const char* key, int value) {
  const HostCall inside;
  log_.Add("SetInteger" + Address(ident, key) + " " + std::to_string(value));
  Store(ident, key, {Value::Type::kInteger, false, value, ""});
}

const ScriptedStorage::Value* ScriptedStorage::Find(const std::string& ident,
                                                    const std::string& key,
                                                    Value::Type type) const {
  const auto found = values_.find({ident, key});
  return found != values_.end() && found->second.type == type ? &found->second : nullptr;
}

const char* ScriptedStorage::GetString(const char* ident, const char* key) {
  const HostCall inside;
  const std::lock_guard<std::mutex> guard(mutex_);
  const Value* value =
      faults_.IsToFail("GetString") ? nullptr : Find(Text(ident), Text(key), Value::Type::kString);
  log_.Add("GetString" + Address(ident, key) +
           (value != nullptr ? " -> " + value->stringValue : " -> null"));
  return value != nullptr ? value->stringValue.c_str() : nullptr;
}

bool ScriptedStorage::GetBoolean(const char* ident, const char* key) {
  const HostCall inside;
  const std::lock_guard<std::mutex> guard(mutex_);
  const Value* value = faults_.IsToFail("GetBoolean")
                           ? nullptr
                           : Find(Text(ident), Text(key), Value::Type::kBoolean);
  const bool result = value != nullptr && value->boolValue;
  log_.Add("GetBoolean" + Address(ident, key) + (result ? " -> true" : " -> false"));
  return result;
}

int ScriptedStorage::GetInteger(const char* ident, const char* key) {
  const HostCall inside;
  const std::lock_guard<std::mutex> guard(mutex_);
  const Value* value = faults_.IsToFail("GetInteger")
                           ? nullptr
                           : Find(Text(ident), Text(key), Value::Type::kInteger);
  const int result = value != nullptr ? value->intValue : 0;
  log_.Add("GetInteger" + Address(ident, key) + " -> " + std::to_string(result));
  return result;
}

int ScriptedStorage::Exists(const char* ident, const char* key) {
  const HostCall inside;
  const std::lock_guard<std::mutex> guard(mutex_);
  const bool result = !faults_.IsToFail("Exists") && values_.count({Text(ident), Text(key)}) != 0;
  log_.Add("Exists" + Address(ident, key) + (result ? " -> 1" : " -> 0"));
  return result ? 1 : 0;
}

int ScriptedStorage::GetStringInto(const char* ident, const char* key, char* buffer,
                                   int sizeBytes) {
  const HostCall inside;
  const std::lock_guard<std::mutex> guard(mutex_);
  const Value* value = Find(Text(ident), Text(key), Value::Type::kString);
  const bool fits =
      value != nullptr && sizeBytes > 0 &&
      (unterminated_ || value->stringValue.size() < static_cast<std::size_t>(sizeBytes));
  const bool success = fits && !faults_.IsToFail("GetStringInto");
  log_.Add("GetStringInto" + Address(ident, key) + " " + std::to_string(sizeBytes) +
           (success ? " -> 1" : " -> 0"));
  if (!success) return 0;
  if (unterminated_) {
    std::memset(buffer, 'A', static_cast<std::size_t>(sizeBytes));
  } else {
    std::memcpy(buffer, value->stringValue.c_str(), value->stringValue.size() + 1);
  }
  return 1;
}

void ScriptedStorage::Put(const std::string& ident, const std::string& key, int value) {
  Store(ident.c_str(), key.c_str(), {Value::Type::kInteger, false, value, ""});
}

void ScriptedStorage::PutBoolean(const std::string& ident, const std::string& key, bool value) {
  Store(ident.c_str(), key.c_str(), {Value::Type::kBoolean, value, 0, ""});
}

void ScriptedStorage::PutString(const std::string& ident, const std::string& key,
                                const std::string& value) {
  Store(ident.c_str(), key.c_str(), {Value::Type::kString, false, 0, value});
}

std::string ScriptedStorage::Dump() const {
  const std::lock_guard<std::mutex> guard(mutex_);
  std::string text;
  for (const auto& [key, value] : values_) {
    text += key.first + " " + key.second + " = ";
    switch (value.type) {
      case Value::Type::kBoolean:
        text += value.boolValue ? "true" : "false";
        break;
      case Value::Type::kInteger:
        text += std::to_string(value.intValue);
        break;
      case Value::Type::kString:
        text += "'" + value.stringValue + "'";
        break;
    }
    text += "\n";
  }
  return text;
}
