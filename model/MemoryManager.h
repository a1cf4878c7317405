// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

#include "model/Model.h"

// The models of a driver. Built while the protocol object is constructed and only read afterwards,
// from any thread; the pointers handed out stay valid as long as nothing is added.
class MemoryManager {
 public:
  // Appends a copy with its memory types.
  void addModel(const Model& model);

  // The first model of that exact name. A name that is not known gives the first model, so that a
  // configuration with an unknown model still finds the driver's own; null only without any model.
  const Model* getModel(const std::string& name) const;

  // The memory type of that exact name in the model of that exact name, without the fallback; or
  // null.
  const MemoryType* getMemoryType(const std::string& model, const std::string& name) const;

 private:
  const Model* findModel(const std::string& name) const;

  std::vector<Model> models_;
};
