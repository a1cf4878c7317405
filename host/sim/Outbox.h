// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <chrono>
#include <cstdint>
#include <deque>
#include <functional>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "host/sim/DeviceMessage.h"
#include "host/sim/TimedChunk.h"

// A message whose last byte has gone out or was lost.
struct SentMessage {
  std::uint64_t number = 0;  // counts from 1
  DeviceMessage message;
  std::vector<std::string> faults;
  std::chrono::steady_clock::time_point begin;  // when its first byte was due to go out
  std::string wire;                             // the bytes that the line took
  std::uint64_t lostBytes = 0;                  // those that it did not take
};

// Messages on their way out, one behind the other, each chunk at its time. Does no input or output
// and reads no clock. One thread.
class Outbox {
 public:
  using Time = std::chrono::steady_clock::time_point;
  // Writes without waiting and returns how many bytes were taken; the rest is lost.
  using Writer = std::function<std::size_t(std::string_view bytes)>;
  using Listener = std::function<void(const SentMessage& message)>;

  Outbox(Writer write, Listener onSent) : write_(std::move(write)), onSent_(std::move(onSent)) {}

  // The message begins at this time, or when the line is free from the one before.
  void Add(std::uint64_t number, DeviceMessage message, WireMessage wire, Time begin);

  // When the next chunk is due; nothing when there is none.
  std::optional<Time> NextDue() const;

  // Hands out everything that is due.
  void Step(Time now);

  bool IsEmpty() const { return messages_.empty(); }

 private:
  struct Outgoing {
    SentMessage sent;
    WireMessage wire;
    Time begin;
    std::size_t nextChunk = 0;
  };

  void WriteChunk(Outgoing* outgoing, Time now);
  void Finish();

  const Writer write_;
  const Listener onSent_;
  std::deque<Outgoing> messages_;
  Time freeAt_{};     // the line is free behind the messages that were added
  Time lastWrite_{};  // when the last chunk really went out
};
