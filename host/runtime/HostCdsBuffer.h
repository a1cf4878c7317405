// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "interfaces/CompareInterface.h"
#include "interfaces/ICDSBuffer.h"

// The buffer service. Plug-ins require it to be there; the interface has no operation beyond its
// name and version. Any thread.
class HostCdsBuffer final : public ICDSBuffer {
 public:
  void* ConvertTo(const char* name) override {
    const bool isOurs =
        CompareInterface(name, "HostCdsBuffer") || CompareInterface(name, "ICDSBuffer");
    return isOurs ? this : nullptr;
  }
  const char* GetImpName() const override { return "HostCdsBuffer"; }
  int GetImpVersion() const override { return 100; }
};
