// SPDX-License-Identifier: Apache-2.0
#include "model/ParameterReplacer.h"

#include <array>

#include "interfaces/IPermanentStorage2.h"
#include "protlib/HostInterfaces.h"

namespace {

// A stored text. The extended interface, where the host offers it, is the only one asked then: its
// failure gives an empty text.
std::string LoadString(IPermanentStorage& storage, const char* ident, const char* key) {
  void* const extended = storage.ConvertTo("IPermanentStorage2");
  if (extended == nullptr) {
    const char* const text = storage.GetString(ident, key);
    return text == nullptr ? "" : text;
  }
  constexpr int kTextBytes = 256;
  std::array<char, kTextBytes + 1> text{};  // one more, for a host that leaves out the zero
  if (static_cast<IPermanentStorage2*>(extended)->GetStringInto(ident, key, text.data(),
                                                                kTextBytes) == 0) {
    return {};
  }
  return text.data();
}

}  // namespace

void ParameterReplacer::setIdent(const char* ident) {
  std::string copy = ident;
  const LeafLock lock(mutex_);
  ident_.swap(copy);
}

std::string ParameterReplacer::Ident() const {
  const LeafLock lock(mutex_);
  return ident_;
}

std::string ParameterReplacer::makeFullName(const std::string& name, int node) {
  return node == kNoNode ? name : "node" + std::to_string(node) + "_" + name;
}

template <typename Load>
ParameterReplacer::Variant ParameterReplacer::LookUp(std::string_view name, int node,
                                                     const Variant& fallback, Load load) {
  // A name without a node is the key itself and is not copied for a value that is cached.
  std::string key = node == kNoNode ? "" : makeFullName(std::string(name), node);
  std::string ident;
  {
    const LeafLock lock(mutex_);
    const auto cached = values_.find(node == kNoNode ? name : std::string_view(key));
    if (cached != values_.end()) {
      return cached->second;
    }
    ident = ident_;
  }
  if (node == kNoNode) {
    key = name;
  }
  Variant value = fallback;
  IPermanentStorage* const storage = piPermanentStorage;
  if (storage != nullptr && storage->Exists(ident.c_str(), key.c_str()) != 0) {
    load(*storage, ident.c_str(), key.c_str(), value);
  }
  const LeafLock lock(mutex_);
  return values_.emplace(key, value).first->second;
}

void ParameterReplacer::get(std::string_view name, int node, const std::string& defaultValue,
                            std::string& out) {
  const Variant fallback{kStringParameter, false, 0, defaultValue};
  out = LookUp(name, node, fallback,
               [](IPermanentStorage& storage, const char* ident, const char* key, Variant& value) {
                 value.stringValue = LoadString(storage, ident, key);
               })
            .stringValue;
}

void ParameterReplacer::get(std::string_view name, int node, int defaultValue, int& out) {
  const Variant fallback{kIntegerParameter, false, defaultValue, {}};
  out = LookUp(name, node, fallback,
               [](IPermanentStorage& storage, const char* ident, const char* key, Variant& value) {
                 value.intValue = storage.GetInteger(ident, key);
               })
            .intValue;
}

void ParameterReplacer::get(std::string_view name, int node, bool defaultValue, bool& out) {
  const Variant fallback{kBooleanParameter, defaultValue, 0, {}};
  out = LookUp(name, node, fallback,
               [](IPermanentStorage& storage, const char* ident, const char* key, Variant& value) {
                 value.boolValue = storage.GetBoolean(ident, key);
               })
            .boolValue;
}

void ParameterReplacer::put(const std::string& key, const Variant& value, bool persist) {
  {
    const LeafLock lock(mutex_);
    values_[key] = value;
  }
  if (persist) {
    Store(key, value);
  }
}

void ParameterReplacer::Store(const std::string& key, const Variant& value) const {
  IPermanentStorage* const storage = piPermanentStorage;
  if (storage == nullptr) {
    return;
  }
  const std::string ident = Ident();
  switch (value.type) {
    case kBooleanParameter:
      storage->SetBoolean(ident.c_str(), key.c_str(), value.boolValue);
      break;
    case kIntegerParameter:
      storage->SetInteger(ident.c_str(), key.c_str(), value.intValue);
      break;
    default:
      storage->SetString(ident.c_str(), key.c_str(), value.stringValue.c_str());
      break;
  }
}
