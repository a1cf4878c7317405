// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <utility>

#include "interfaces/CompareInterface.h"

// A named host service that only has a name and a version; Interface is one of the interfaces
// without operations of their own.
template <class Interface>
class ScriptedService final : public Interface {
 public:
  explicit ScriptedService(std::string interfaceName) : interfaceName_(std::move(interfaceName)) {}

  void* ConvertTo(const char* name) override {
    return CompareInterface(name, interfaceName_.c_str()) ? this : nullptr;
  }
  const char* GetImpName() const override { return "ScriptedService"; }
  int GetImpVersion() const override { return 1; }

 private:
  const std::string interfaceName_;
};
