// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "interfaces/INamedInterface.h"

class IProtocol;

// The plug-in's factory of protocol instances. Host threads, after the module's Init.
class IProtocolFactory : public INamedInterface {
 public:
  // slot 5. Creates a protocol by exact name ("LOKA"); null for any other name or when memory is
  // short. The caller owns it and hands it back with DeleteProtocol.
  virtual IProtocol* CreateProtocol(const char* name) = 0;

  // slot 6. Deletes a protocol that CreateProtocol returned, with its tags. Null is ignored. Call
  // IProtocol::Stop first; it must not be in use by any thread.
  virtual void DeleteProtocol(IProtocol* protocol) = 0;
};
