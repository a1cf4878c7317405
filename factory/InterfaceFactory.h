// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "factory/ProtModule.h"
#include "factory/ProtocolFactory.h"
#include "interfaces/IInterfaceFactory.h"

// What the library's entry point hands out: the module and the protocol factory, by name. Both live
// from the library's load to its unload. Any thread.
class InterfaceFactory final : public IInterfaceFactory {
 public:
  IInterface* CreateInterface(const char* name) override;

  // Does nothing: what CreateInterface hands out stays.
  void ReleaseInterface(IInterface* interface) override;

 private:
  ProtocolFactory protocolFactory_;
  ProtModule module_;
};
