// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "interfaces/IProtModule.h"
#include "interfaces/IProtocol7.h"
#include "interfaces/IProtocolFactory.h"
#include "tests/support/PluginLibrary.h"

// Module and protocol factory of the loaded library, by interface. Gives back what it still holds
// when it goes: the protocols first, then the uses of the module.
class PluginUnderTest {
 public:
  explicit PluginUnderTest(PluginLibrary& library = PluginLibrary::Shared());
  ~PluginUnderTest();
  PluginUnderTest(const PluginUnderTest&) = delete;
  PluginUnderTest& operator=(const PluginUnderTest&) = delete;

  // False when the library or one of the two interfaces is not there.
  bool IsLoaded() const { return module_ != nullptr && protocols_ != nullptr; }
  IInterfaceFactory* Factory() const { return library_.Factory(); }
  IProtModule* Module() const { return module_; }
  IProtocolFactory* Protocols() const { return protocols_; }

  // IProtModule::Init, counted so that the destructor can undo it.
  int Init(IInterfaceFactory* host);
  void Close();

 private:
  PluginLibrary& library_;
  IProtModule* module_ = nullptr;
  IProtocolFactory* protocols_ = nullptr;
  int initCount_ = 0;
};
