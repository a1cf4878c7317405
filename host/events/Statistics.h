// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <map>
#include <mutex>
#include <nlohmann/json_fwd.hpp>
#include <string>

#include "host/events/EventSink.h"

// Counts what the events tell. Any thread.
class Statistics final : public EventSink {
 public:
  void OnEvent(const HostEvent& event) override;

  // Keys: since (UTC), tokens, token_bytes, received_bytes, missed_bytes (too fast to be among the
  // received ones), sent_bytes, sends, lost_sends, drops (by reason), dropped_bytes, losses,
  // reconnects, findings.
  nlohmann::json ToJson() const;

 private:
  struct Counter;

  mutable std::mutex mutex_;
  std::int64_t sinceUs_ = 0;
  std::uint64_t tokens_ = 0;
  std::uint64_t tokenBytes_ = 0;
  std::uint64_t receivedBytes_ = 0;
  std::uint64_t missedBytes_ = 0;
  std::uint64_t sentBytes_ = 0;
  std::uint64_t sends_ = 0;
  std::uint64_t lostSends_ = 0;
  std::map<std::string, std::uint64_t> drops_;
  std::uint64_t droppedBytes_ = 0;
  std::uint64_t losses_ = 0;
  std::uint64_t reconnects_ = 0;
  std::uint64_t findings_ = 0;
};
