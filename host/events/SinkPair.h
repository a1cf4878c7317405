// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "host/events/EventSink.h"

// Hands each event to two sinks, one after the other.
class SinkPair final : public EventSink {
 public:
  // The second one may be null. Both must outlive the pair.
  SinkPair(EventSink* first, EventSink* second) : first_(first), second_(second) {}

  void OnEvent(const HostEvent& event) override {
    first_->OnEvent(event);
    if (second_ != nullptr) {
      second_->OnEvent(event);
    }
  }

 private:
  EventSink* const first_;
  EventSink* const second_;
};
