// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <deque>
#include <functional>
#include <mutex>
#include <optional>
#include <utility>

#include "host/events/EventSink.h"

// Keeps events until a certain thread takes them: events of requests come on the thread that
// carries them out, and a terminal has one line that only one thread can draw.
class EventInbox final : public EventSink {
 public:
  // `onEvent` is called behind each event, on the thread that publishes it. It must not wait.
  explicit EventInbox(std::function<void()> onEvent) : onEvent_(std::move(onEvent)) {}

  // Any thread.
  void OnEvent(const HostEvent& event) override {
    {
      const std::lock_guard<std::mutex> lock(mutex_);
      events_.push_back(event);
    }
    onEvent_();
  }

  // Both on the thread that takes.
  bool HasEvents() const {
    const std::lock_guard<std::mutex> lock(mutex_);
    return !events_.empty();
  }

  std::optional<HostEvent> Take() {
    const std::lock_guard<std::mutex> lock(mutex_);
    if (events_.empty()) {
      return std::nullopt;
    }
    HostEvent event = std::move(events_.front());
    events_.pop_front();
    return event;
  }

 private:
  const std::function<void()> onEvent_;
  mutable std::mutex mutex_;
  std::deque<HostEvent> events_;
};
