// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <map>
#include <mutex>
#include <string>
#include <utility>

#include "interfaces/IPermanentStorage2.h"
#include "tests/support/CallLog.h"
#include "tests/support/FaultPlan.h"

// Permanent storage in memory. It answers a query of the wrong type with false, 0 or null, as a
// storage may that keeps its values by type.
class ScriptedStorage final : public IPermanentStorage2 {
 public:
  struct Value {
    enum class Type { kBoolean, kInteger, kString };
    Type type = Type::kInteger;
    bool boolValue = false;
    int intValue = 0;
    std::string stringValue;
  };
  using Key = std::pair<std::string, std::string>;

  ScriptedStorage(CallLog& log, FaultPlan& faults) : log_(log), faults_(faults) {}

  // Whether IPermanentStorage2 is offered.
  void SetExtended(bool extended) { extended_ = extended; }
  // GetStringInto fills the whole buffer and reports success without a terminating zero.
  void SetUnterminated(bool unterminated) { unterminated_ = unterminated; }

  void* ConvertTo(const char* name) override;
  const char* GetImpName() const override { return "ScriptedStorage"; }
  int GetImpVersion() const override { return 1; }
  void SetString(const char* ident, const char* key, const char* text) override;
  void SetBoolean(const char* ident, const char* key, bool value) override;
  void SetInteger(const char* ident, const char* key, int value) override;
  const char* GetString(const char* ident, const char* key) override;
  bool GetBoolean(const char* ident, const char* key) override;
  int GetInteger(const char* ident, const char* key) override;
  int Exists(const char* ident, const char* key) override;
  int GetStringInto(const char* ident, const char* key, char* buffer, int sizeBytes) override;

  // The test's own access, not recorded.
  void Put(const std::string& ident, const std::string& key, int value);
  void PutBoolean(const std::string& ident, const std::string& key, bool value);
  void PutString(const std::string& ident, const std::string& key, const std::string& value);
  // All values as lines "ident key = value", in key order.
  std::string Dump() const;

 private:
  const Value* Find(const std::string& ident, const std::string& key, Value::Type type) const;
  void Store(const char* ident, const char* key, Value value);

  CallLog& log_;
  FaultPlan& faults_;
  bool extended_ = false;
  bool unterminated_ = false;
  mutable std::mutex mutex_;
  std::map<Key, Value> values_;
};
