// SPDX-License-Identifier: Apache-2.0
#include "model/Model.h"

#include <algorithm>

void Model::addMemoryType(const MemoryType& memoryType) {
  if (findMemoryType(memoryType.getName()) == nullptr) {
    memoryTypes_.push_back(memoryType);
  }
}

const MemoryType* Model::findMemoryType(const std::string& name) const {
  const auto found =
      std::find_if(memoryTypes_.begin(), memoryTypes_.end(),
                   [&name](const MemoryType& entry) { return entry.getName() == name; });
  return found == memoryTypes_.end() ? nullptr : &*found;
}
