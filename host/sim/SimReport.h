// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <string>

#include "host/sim/DeviceMessage.h"
#include "host/sim/Outbox.h"

// What a simulator tells: as text, or as one JSON object a line. As text, stdout has the path of
// the port and the labels of a printer; everything else goes to stderr. The keys of the objects:
//
//   all        t (UTC, microseconds), ev
//   port       state (plugged, unplugged, open, closed), path and link (where there is one)
//   sent       n, what, text, hex (the body as meant), fault (names), wire (hex of the bytes that
//              the line took), lost (bytes it did not take), why (only when some are lost: closed,
//              unplugged, full)
//   received   n, what, text, hex
//   end        sent, faulty, lost (messages of which bytes were lost), lost_bytes, received, missed
//              (intervals that were left out)
//
// One thread.
class SimReport {
 public:
  explicit SimReport(bool isJson) : isJson_(isJson) {}

  void OnPort(const std::string& state, const std::string& path, const std::string& link);
  void OnSent(const SentMessage& message, const std::string& whyLost, std::int64_t timeUs);
  void OnReceived(const DeviceInput& input);
  void OnEnd(std::uint64_t missedIntervals) const;

  // Messages that went out so far, echoes not counted.
  std::uint64_t SentMessages() const { return sent_; }

 private:
  const bool isJson_;
  bool isFirstPort_ = true;
  std::uint64_t sent_ = 0;
  std::uint64_t faulty_ = 0;
  std::uint64_t lostMessages_ = 0;
  std::uint64_t lostBytes_ = 0;
  std::uint64_t received_ = 0;
};
