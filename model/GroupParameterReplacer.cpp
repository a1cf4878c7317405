// SPDX-License-Identifier: Apache-2.0
#include "model/GroupParameterReplacer.h"

#include <utility>

#include "model/ParameterReplacer.h"

GroupParameterReplacer::GroupParameterReplacer(const GroupParameterReplacer& other)
    : values_(other.Snapshot()) {}

GroupParameterReplacer::Values GroupParameterReplacer::Snapshot() const {
  const LeafLock lock(mutex_);
  return values_;
}

std::string GroupParameterReplacer::makeFullName(const std::string& name, int node) {
  return node == kNoNode ? name : name + std::to_string(node);
}

void GroupParameterReplacer::Stage(Variant value) {
  const std::string key = makeFullName(value.name, value.node);
  const LeafLock lock(mutex_);
  values_[key] = std::move(value);
}

void GroupParameterReplacer::set(const std::string& name, int node, const char* value) {
  Stage({kStringParameter, name, false, 0, value, node});
}

void GroupParameterReplacer::set(const std::string& name, int node, int value) {
  Stage({kIntegerParameter, name, false, value, {}, node});
}

void GroupParameterReplacer::set(const std::string& name, int node, bool value) {
  Stage({kBooleanParameter, name, value, 0, {}, node});
}

template <typename Field>
bool GroupParameterReplacer::Find(std::string_view name, int node, Field Variant::*field,
                                  Field& out) const {
  // A name without a node is the key itself and is not copied.
  const std::string withNode = node == kNoNode ? "" : makeFullName(std::string(name), node);
  const LeafLock lock(mutex_);
  const auto staged = values_.find(node == kNoNode ? name : std::string_view(withNode));
  if (staged == values_.end()) {
    return false;
  }
  out = staged->second.*field;
  return true;
}

bool GroupParameterReplacer::get(std::string_view name, int node, std::string& out) const {
  return Find(name, node, &Variant::stringValue, out);
}

bool GroupParameterReplacer::get(std::string_view name, int node, int& out) const {
  return Find(name, node, &Variant::intValue, out);
}

bool GroupParameterReplacer::get(std::string_view name, int node, bool& out) const {
  return Find(name, node, &Variant::boolValue, out);
}

void GroupParameterReplacer::activate(ParameterReplacer& target, int node, bool persist) const {
  // A copy, so that permanent storage is written without holding the lock.
  for (const auto& entry : Snapshot()) {
    const Variant& staged = entry.second;
    if (staged.node != node || staged.type < kBooleanParameter || staged.type > kStringParameter) {
      continue;
    }
    target.put(ParameterReplacer::makeFullName(staged.name, node),
               {staged.type, staged.boolValue, staged.intValue, staged.stringValue}, persist);
  }
}
