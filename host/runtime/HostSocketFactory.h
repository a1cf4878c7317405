// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "interfaces/CompareInterface.h"
#include "interfaces/ISocketFactory.h"

// The socket service. Plug-ins require it to be there; the interface has no operation beyond its
// name and version. Any thread.
class HostSocketFactory final : public ISocketFactory {
 public:
  void* ConvertTo(const char* name) override {
    const bool isOurs =
        CompareInterface(name, "HostSocketFactory") || CompareInterface(name, "ISocketFactory");
    return isOurs ? this : nullptr;
  }
  const char* GetImpName() const override { return "HostSocketFactory"; }
  int GetImpVersion() const override { return 100; }
};
