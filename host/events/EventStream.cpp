// SPDX-License-Identifier: Apache-2.0
#include "host/events/EventStream.h"

#include <algorithm>
#include <utility>

#include "host/events/WallClock.h"

void EventStream::Publish(HostEvent::Detail detail) { Publish(std::move(detail), WallClockUs()); }

void EventStream::Publish(HostEvent::Detail detail, std::int64_t timeUs) {
  const HostEvent event{timeUs, port_, std::move(detail)};
  const std::lock_guard<std::mutex> lock(mutex_);
  const std::string clockChange = clockWatch_.Look();
  if (!clockChange.empty()) {
    HandOn({WallClockUs(), port_, NoteMade{clockChange}});
  }
  HandOn(event);
}

void EventStream::HandOn(const HostEvent& event) const {
  for (EventSink* const sink : sinks_) {
    sink->OnEvent(event);
  }
}

void EventStream::Add(EventSink* sink) {
  const std::lock_guard<std::mutex> lock(mutex_);
  sinks_.push_back(sink);
}

void EventStream::Remove(EventSink* sink) {
  const std::lock_guard<std::mutex> lock(mutex_);
  sinks_.erase(std::remove(sinks_.begin(), sinks_.end(), sink), sinks_.end());
}
