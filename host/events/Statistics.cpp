// SPDX-License-Identifier: Apache-2.0
#include "host/events/Statistics.h"

#include <nlohmann/json.hpp>

#include "host/events/WallClock.h"

// One event's part; called with the lock held.
struct Statistics::Counter {
  Statistics* counts;

  void operator()(const BytesReceived& detail) const {
    counts->receivedBytes_ += detail.bytes.size();
  }
  void operator()(const BytesSent& detail) const {
    ++counts->sends_;
    counts->sentBytes_ += detail.takenBytes;
    counts->lostSends_ += detail.takenBytes < detail.bytes.size() ? 1U : 0U;
  }
  void operator()(const TokenReceived& detail) const {
    ++counts->tokens_;
    counts->tokenBytes_ += detail.lengthBytes;
  }
  void operator()(const BytesDropped& detail) const {
    ++counts->drops_[detail.reason];
    counts->droppedBytes_ += detail.bytes.size();
  }
  void operator()(const PortChanged& detail) const {
    counts->losses_ += detail.state == "lost" ? 1U : 0U;
    counts->reconnects_ += detail.state == "back" ? 1U : 0U;
  }
  void operator()(const BytesLabelled& /*detail*/) const {}
  void operator()(const FindingMade& /*detail*/) const { ++counts->findings_; }
  void operator()(const SettingChanged& /*detail*/) const {}
  void operator()(const ConsoleReplied& /*detail*/) const {}
  void operator()(const NoteMade& detail) const { counts->missedBytes_ += detail.missedBytes; }
};

void Statistics::OnEvent(const HostEvent& event) {
  const std::lock_guard<std::mutex> lock(mutex_);
  if (sinceUs_ == 0) {
    sinceUs_ = event.timeUs;
  }
  std::visit(Counter{this}, event.detail);
}

nlohmann::json Statistics::ToJson() const {
  const std::lock_guard<std::mutex> lock(mutex_);
  nlohmann::json drops = nlohmann::json::object();
  for (const auto& [reason, count] : drops_) {
    drops[reason] = count;
  }
  return {{"since", sinceUs_ == 0 ? "" : UtcText(sinceUs_)},
          {"tokens", tokens_},
          {"token_bytes", tokenBytes_},
          {"received_bytes", receivedBytes_},
          {"missed_bytes", missedBytes_},
          {"sent_bytes", sentBytes_},
          {"sends", sends_},
          {"lost_sends", lostSends_},
          {"drops", drops},
          {"dropped_bytes", droppedBytes_},
          {"losses", losses_},
          {"reconnects", reconnects_},
          {"findings", findings_}};
}
