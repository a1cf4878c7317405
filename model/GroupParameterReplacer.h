// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>
#include <map>
#include <string>
#include <string_view>

#include "model/ParameterValue.h"
#include "protlib/LeafMutex.h"

class ParameterReplacer;

// The staged serial settings: values that were written but are not in effect until they are
// activated, all at once. Activation leaves them staged, so that a later read still finds them.
// Any thread; a copy is a snapshot.
class GroupParameterReplacer {
 public:
  // One staged value; only the field of its type counts.
  struct Variant {
    int type = kBooleanParameter;  // a ParameterKind
    std::string name;              // without the node
    bool boolValue = false;
    int intValue = 0;
    std::string stringValue;
    int node = 0;
  };

  GroupParameterReplacer() = default;
  GroupParameterReplacer(const GroupParameterReplacer& other);
  GroupParameterReplacer& operator=(const GroupParameterReplacer&) = delete;
  ~GroupParameterReplacer() = default;

  // "name" without a node, "name3" for node 3.
  static std::string makeFullName(const std::string& name, int node);

  // Stages a value, replacing the staged value of that name and node, whatever its type.
  void set(const std::string& name, int node, const char* value);
  void set(const std::string& name, int node, int value);
  void set(const std::string& name, int node, bool value);

  // The staged value; false, with `out` untouched, when nothing is staged. A value staged with
  // another type gives its zero value of the asked one.
  bool get(std::string_view name, int node, std::string& out) const;
  bool get(std::string_view name, int node, int& out) const;
  bool get(std::string_view name, int node, bool& out) const;

  // Makes every staged value of the node the active one, in the order of the keys; with `persist`
  // also stores it permanently.
  void activate(ParameterReplacer& target, int node, bool persist) const;

 private:
  using Values = std::map<std::string, Variant, std::less<>>;

  void Stage(Variant value);
  template <typename Field>
  bool Find(std::string_view name, int node, Field Variant::*field, Field& out) const;
  Values Snapshot() const;

  mutable LeafMutex mutex_;
  Values values_ LOKA_GUARDED_BY(mutex_);
};
