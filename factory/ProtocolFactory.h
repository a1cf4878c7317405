// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "interfaces/IProtocolFactory.h"

// Creates and deletes protocol instances. Keeps no list of them: each belongs to the host from
// CreateProtocol to DeleteProtocol. Host threads.
class ProtocolFactory : public IProtocolFactory {
 public:
  void* ConvertTo(const char* name) override;
  const char* GetImpName() const override;
  int GetImpVersion() const override;
  IProtocol* CreateProtocol(const char* name) override;
  void DeleteProtocol(IProtocol* protocol) override;
};
