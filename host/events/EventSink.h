// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "host/events/HostEvent.h"

// Takes events, one after the other, in the order in which they happened.
class EventSink {
 public:
  virtual ~EventSink() = default;

  // Called on the thread that serves the instance. Must not wait.
  virtual void OnEvent(const HostEvent& event) = 0;
};
