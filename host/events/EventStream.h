// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <mutex>
#include <string>
#include <utility>
#include <vector>

#include "host/events/ClockWatch.h"
#include "host/events/EventSink.h"

// Hands each event of one port to everybody who listens. Events of several threads come one after
// the other. Any thread.
class EventStream {
 public:
  explicit EventStream(std::string port) : port_(std::move(port)) {}
  ~EventStream() = default;

  EventStream(const EventStream&) = delete;
  EventStream& operator=(const EventStream&) = delete;

  // Stamps the event and hands it on. The time is now, or `timeUs` when the event happened earlier.
  // The first event behind a change of the machine's clock has a note about it in front. A sink
  // must not publish.
  void Publish(HostEvent::Detail detail);
  void Publish(HostEvent::Detail detail, std::int64_t timeUs);

  // The sink must live until it is removed. After Remove has returned it is not called any more.
  void Add(EventSink* sink);
  void Remove(EventSink* sink);

  const std::string& Port() const { return port_; }

 private:
  void HandOn(const HostEvent& event) const;

  const std::string port_;
  std::mutex mutex_;
  ClockWatch clockWatch_;
  std::vector<EventSink*> sinks_;
};
