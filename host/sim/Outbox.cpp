// SPDX-License-Identifier: Apache-2.0
#include "host/sim/Outbox.h"

#include <algorithm>
#include <utility>

void Outbox::Add(std::uint64_t number, DeviceMessage message, WireMessage wire, Time begin) {
  const Time start = std::max(begin, freeAt_);
  freeAt_ = start + wire.length;
  Outgoing outgoing;
  outgoing.sent = {number, std::move(message), std::move(wire.faults), start, {}, 0};
  outgoing.wire = std::move(wire);
  outgoing.begin = start;
  messages_.push_back(std::move(outgoing));
}

std::optional<Outbox::Time> Outbox::NextDue() const {
  if (messages_.empty()) {
    return std::nullopt;
  }
  const Outgoing& first = messages_.front();
  const std::vector<TimedChunk>& chunks = first.wire.chunks;
  if (first.nextChunk >= chunks.size()) {
    return first.begin;
  }
  const TimedChunk& chunk = chunks[first.nextChunk];
  const Time due = first.begin + chunk.offset;
  if (!chunk.isBehindPause || first.nextChunk == 0) {
    return due;
  }
  return std::max(due, lastWrite_ + (chunk.offset - chunks[first.nextChunk - 1].offset));
}

void Outbox::Step(Time now) {
  for (auto due = NextDue(); due && *due <= now; due = NextDue()) {
    Outgoing& first = messages_.front();
    if (first.nextChunk < first.wire.chunks.size()) {
      WriteChunk(&first, now);
    }
    if (first.nextChunk >= first.wire.chunks.size()) {
      Finish();
    }
  }
}

void Outbox::WriteChunk(Outgoing* outgoing, Time now) {
  const TimedChunk& chunk = outgoing->wire.chunks[outgoing->nextChunk++];
  if (chunk.isBehindPause) {
    // What follows keeps its distance from this chunk, messages behind it included.
    const auto late = now - (outgoing->begin + chunk.offset);
    outgoing->begin += late;
    freeAt_ += late;
    for (std::size_t i = 1; i < messages_.size(); ++i) {
      messages_[i].begin =
          std::max(messages_[i].begin, messages_[i - 1].begin + messages_[i - 1].wire.length);
    }
  }
  lastWrite_ = now;
  const std::size_t taken = write_(chunk.bytes);
  outgoing->sent.wire.append(chunk.bytes, 0, taken);
  outgoing->sent.lostBytes += chunk.bytes.size() - taken;
}

void Outbox::Finish() {
  const Outgoing done = std::move(messages_.front());
  messages_.pop_front();
  onSent_(done.sent);
}
