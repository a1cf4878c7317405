// SPDX-License-Identifier: Apache-2.0
#include "factory/InterfaceFactory.h"

#include "interfaces/CompareInterface.h"

namespace {

InterfaceFactory Factory;

}  // namespace

// The library's entry point.
extern "C" __attribute__((visibility("default"))) IInterfaceFactory* GetInterfaceFactory() {
  return &Factory;
}

IInterface* InterfaceFactory::CreateInterface(const char* name) {
  if (CompareInterface(name, "IProtocolFactory") || CompareInterface(name, "ProtocolFactory")) {
    return &protocolFactory_;
  }
  if (CompareInterface(name, "IProtModule") || CompareInterface(name, "ProtModule")) {
    return &module_;
  }
  return nullptr;
}

void InterfaceFactory::ReleaseInterface(IInterface* /*interface*/) {}
