// SPDX-License-Identifier: Apache-2.0
#include "factory/ProtocolFactory.h"

#include <memory>

#include "driver/CreateProtocol_LOKA.h"
#include "interfaces/CompareInterface.h"
#include "interfaces/IProtocol.h"
#include "protlib/NoThrow.h"

void* ProtocolFactory::ConvertTo(const char* name) {
  return CompareInterface(name, "ProtocolFactory") || CompareInterface(name, "IProtocolFactory")
             ? this
             : nullptr;
}

const char* ProtocolFactory::GetImpName() const { return "ProtFactoryInDLL"; }

int ProtocolFactory::GetImpVersion() const { return 100; }

IProtocol* ProtocolFactory::CreateProtocol(const char* name) {
  if (!CompareInterface(name, "LOKA")) {
    return nullptr;
  }
  return NoThrow(static_cast<IProtocol*>(nullptr), CreateProtocol_LOKA);
}

void ProtocolFactory::DeleteProtocol(IProtocol* protocol) {
  const std::unique_ptr<IProtocol> owner(protocol);
}
