// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <deque>
#include <functional>
#include <optional>
#include <string>
#include <vector>

#include "host/base/Deadline.h"
#include "host/events/HostEvent.h"
#include "host/framing/FramingCheck.h"
#include "host/instance/Answer.h"
#include "host/instance/LineIntake.h"
#include "host/runtime/TokenReader.h"

class EventStream;
class HostSession;
class Requests;

// Turns what happened on the line and what the driver has queued into events: bytes as they came,
// drops with their reason, tokens as the driver's tags show them, and a finding where the driver's
// token is not the one that the host's own reading of the bytes gives. One thread, which holds the
// driver's mutex meanwhile.
class TokenPump final : public CheckSink {
 public:
  // All must outlive the pump. `acknowledges`: each token is acknowledged once it is published.
  // Otherwise that is left to others, and a token is published when it becomes the oldest one; the
  // pump then does not see every token and compares none.
  TokenPump(HostSession* session, EventStream* events, const Requests* requests, bool acknowledges);

  // Works off records behind which more are there already; no token is taken.
  void Follow(const std::vector<LineRecord>& records);

  // Works off the records, then the driver's queue until isDone, asked in front of each token, says
  // so: what nobody wants any more stays in the queue. Refused when the driver does not let its
  // tokens be read.
  Answer Run(const std::vector<LineRecord>& records, const std::function<bool()>& isDone);

  // The driver has queued a token whose bytes are not among the records yet: it tells the port that
  // it took them when it asks for the next one. Run should be called again soon.
  bool IsWaitingForLine() const { return lineWait_.has_value(); }

  // Tokens were left in the queue although they are wanted: Run should be called again at once,
  // with the mutex free in between.
  bool HasMore() const { return hasMore_; }

  // Gives the driver's tags back; they are made again when they are needed.
  void GiveTagsBack() { reader_.GiveTagsBack(); }

  // The published token that is still the oldest one, for those who come later.
  std::optional<TokenReceived> Head() const;

  void OnLabelled(const LabelledBytes& labelled) override;
  void OnCutToken(const CutToken& token) override;
  void OnFinding(const FramingFinding& finding) override;
  void OnQueueFull(const CutToken& token) override;

 private:
  // A token as the host read it from the line.
  struct Frame {
    std::string bytes;
    std::size_t prefixBytes = 0;
    std::size_t suffixBytes = 0;
  };
  struct LineToken {
    std::string bytes;
    Frame frame;
    std::int64_t durationUs = 0;
  };

  void Follow(const LineRecord& record);
  void FollowBytes(const LineRecord& record);
  void FollowSilence(int silenceMs);
  void FollowQueue();
  void DropOldest();
  void FollowSettings();
  Answer PublishTokens(const std::function<bool()>& isDone);
  void PublishToken(const ReceivedToken& token);
  std::deque<LineToken>::iterator FindOnLine(const ReceivedToken& token);
  bool MustWaitForLine(const ReceivedToken& token);
  void AddWhatTheLineKnows(const ReceivedToken& token, TokenReceived* detail);
  bool IsHeadPublished() const;

  EventStream* const events_;
  const Requests* const requests_;
  const bool acknowledges_;
  TokenReader reader_;
  FramingCheck check_;     // used when this pump takes the tokens
  ByteLabeller labeller_;  // used when others do
  std::uint64_t settingsVersion_ = 0;
  std::uint64_t tokenCount_ = 0;
  std::optional<TokenReceived> head_;
  std::uint64_t expectedTokens_ = 0;  // in the driver's queue, by what the line says
  std::uint64_t queueVersion_ = 0;
  std::uint64_t headVersion_ = 0;  // Requests::HeadVersion when head_ was read

  // Of the frame that is being read from the line.
  std::int64_t recordTimeUs_ = 0;
  std::int64_t recordFirstNs_ = 0;
  std::int64_t recordLastNs_ = 0;
  std::uint64_t servedBytes_ = 0;
  std::optional<std::int64_t> frameFirstNs_;
  Frame frame_;  // what was told of the next token
  std::optional<Deadline> lineWait_;
  bool hasMore_ = false;
  std::deque<LineToken> lineTokens_;  // cut from the line, not yet met in the driver's queue
};
