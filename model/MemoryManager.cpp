// SPDX-License-Identifier: Apache-2.0
#include "model/MemoryManager.h"

#include <algorithm>

void MemoryManager::addModel(const Model& model) { models_.push_back(model); }

const Model* MemoryManager::findModel(const std::string& name) const {
  const auto found = std::find_if(models_.begin(), models_.end(),
                                  [&name](const Model& entry) { return entry.getName() == name; });
  return found == models_.end() ? nullptr : &*found;
}

const Model* MemoryManager::getModel(const std::string& name) const {
  const Model* model = findModel(name);
  if (model == nullptr && !models_.empty()) {
    model = &models_.front();
  }
  return model;
}

const MemoryType* MemoryManager::getMemoryType(const std::string& model,
                                               const std::string& name) const {
  const Model* found = findModel(model);
  return found == nullptr ? nullptr : found->findMemoryType(name);
}
