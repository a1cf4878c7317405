// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "interfaces/IInterface.h"

// Common head of every interface that is created by name.
class INamedInterface : public IInterface {
 public:
  // slot 3. Name of the implementation, for information only. A host object may answer null.
  // Any thread.
  virtual const char* GetImpName() const = 0;

  // slot 4. Version of the implementation, for information only. Any thread.
  virtual int GetImpVersion() const = 0;
};
