// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>
#include <map>
#include <string>
#include <string_view>

#include "model/ParameterValue.h"
#include "protlib/LeafMutex.h"

// The active overrides of the serial settings: a cache in front of the host's permanent storage. A
// value that is not cached is looked up there once, and the caller's default (the configured value)
// is taken when it is not there either. Only `put` replaces a cached value.
//
// Any thread. Permanent storage is asked without a lock, so two threads may ask for the same key at
// once; the first answer, or a value put meanwhile, stays.
class ParameterReplacer {
 public:
  // One active value; only the field of its type counts.
  struct Variant {
    int type = kBooleanParameter;  // a ParameterKind
    bool boolValue = false;
    int intValue = 0;
    std::string stringValue;
  };

  // The key space in permanent storage. Set at each start, before the first look-up.
  void setIdent(const char* ident);

  // "name" without a node, "node3_name" for node 3.
  static std::string makeFullName(const std::string& name, int node);

  // Looks a value up. A cached value of another type gives its zero value of the asked one.
  void get(std::string_view name, int node, const std::string& defaultValue, std::string& out);
  void get(std::string_view name, int node, int defaultValue, int& out);
  void get(std::string_view name, int node, bool defaultValue, bool& out);

  // Replaces the active value of a key; with `persist` also writes it to permanent storage, when
  // the host has one.
  void put(const std::string& key, const Variant& value, bool persist);

 private:
  template <typename Load>
  Variant LookUp(std::string_view name, int node, const Variant& fallback, Load load);
  void Store(const std::string& key, const Variant& value) const;
  std::string Ident() const;

  mutable LeafMutex mutex_;
  std::string ident_ LOKA_GUARDED_BY(mutex_);
  std::map<std::string, Variant, std::less<>> values_ LOKA_GUARDED_BY(mutex_);
};
