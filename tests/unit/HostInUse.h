// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "protlib/HostInterfaces.h"
#include "tests/support/ScriptedHost.h"

// A scripted host whose services the driver sees for as long as the object lives. A test may set
// any of the pointers to null for a host that lacks the service.
class HostInUse {
 public:
  HostInUse() {
    piMultiTask = &host_.MultiTask();
    piSerialFactory = &host_.SerialFactory();
    piPermanentStorage = &host_.Storage();
  }
  ~HostInUse() {
    piMultiTask = nullptr;
    piSerialFactory = nullptr;
    piPermanentStorage = nullptr;
  }
  HostInUse(const HostInUse&) = delete;
  HostInUse& operator=(const HostInUse&) = delete;

  ScriptedHost* operator->() { return &host_; }
  ScriptedHost& operator*() { return host_; }

 private:
  ScriptedHost host_;
};
