// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "interfaces/INamedInterface.h"

class IInterfaceFactory;

// The plug-in's module: binds the library to the host's services. Counts its users. Loading thread.
class IProtModule : public INamedInterface {
 public:
  // slot 5. Obtains the host's services from its factory, which must outlive the matching Close.
  // Returns 1, or 0 with the reason in GetLastError. A further Init while one is in effect only
  // counts.
  virtual int Init(IInterfaceFactory* hostFactory) = 0;

  // slot 6. Undoes one Init; the last one releases the services. Every protocol must be gone by
  // then.
  virtual void Close() = 0;

  // slot 7. Why the last failed Init failed; empty when none has failed. Valid until the next Init.
  virtual const char* GetLastError() const = 0;
};
