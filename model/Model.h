// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <utility>
#include <vector>

#include "model/MemoryType.h"

// A kind of device: a name and the memory types that its tags can address, in the order added.
class Model {
 public:
  explicit Model(std::string name) : name_(std::move(name)) {}

  const std::string& getName() const { return name_; }

  void setMaxDatagramItems(int items) { maxDatagramItems_ = items; }
  void setMaxDatagramLength(int lengthBytes) { maxDatagramLength_ = lengthBytes; }

  // Appends a copy, unless a memory type of that exact name is there already: the first one stays.
  void addMemoryType(const MemoryType& memoryType);

  // The memory type of that exact name, or null. Valid until a memory type is added.
  const MemoryType* findMemoryType(const std::string& name) const;

 private:
  std::string name_;
  int maxDatagramItems_ = 0;
  int maxDatagramLength_ = 0;
  std::vector<MemoryType> memoryTypes_;
};
