// SPDX-License-Identifier: Apache-2.0
#pragma once

class IInterface;

// Creates interfaces by name. Implemented by the host (its services) and by the plug-in (its module
// and its protocol factory). It has no virtual destructor and is never deleted by the other side.
class IInterfaceFactory {
 public:
  // slot 0. Returns the named interface, or null when the name is not known.
  // The caller hands the result back with ReleaseInterface. Loading thread.
  virtual IInterface* CreateInterface(const char* name) = 0;

  // slot 1. Takes back an interface that CreateInterface returned. Loading thread.
  virtual void ReleaseInterface(IInterface* interface) = 0;

 protected:
  ~IInterfaceFactory() = default;
};

// Name and type of the one function through which a host reaches the plug-in. It never fails, never
// allocates and returns the same factory on every call; the factory lives as long as the library is
// loaded. Any thread.
inline constexpr const char* kGetInterfaceFactoryName = "GetInterfaceFactory";
using GetInterfaceFactoryFunction = IInterfaceFactory* (*)();
