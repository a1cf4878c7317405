// SPDX-License-Identifier: Apache-2.0
#include "host/instance/TokenPump.h"

#include <algorithm>
#include <utility>

#include "host/base/Nanoseconds.h"
#include "host/events/EventStream.h"
#include "host/instance/Requests.h"
#include "host/port/ErrorName.h"

namespace {

// More of the line's tokens than the driver's queue holds, and those that are being queued, are not
// worth keeping.
constexpr std::size_t kSpareLineTokens = 2000;
// A device that never pauses must let others call the driver in between.
constexpr int kMaxTokensAtOnce = 200;
constexpr int kLineWaitMs = 50;

}  // namespace

TokenPump::TokenPump(HostSession* session, EventStream* events, const Requests* requests,
                     bool acknowledges)
    : events_(events),
      requests_(requests),
      acknowledges_(acknowledges),
      reader_(session),
      check_(requests->Framing(), this),
      labeller_(requests->Framing(), this),
      settingsVersion_(requests->SettingsVersion()) {
  reader_.SetHexMode(requests->Framing().isHex);
}

void TokenPump::Follow(const std::vector<LineRecord>& records) {
  FollowSettings();
  for (const LineRecord& record : records) {
    Follow(record);
  }
}

Answer TokenPump::Run(const std::vector<LineRecord>& records, const std::function<bool()>& isDone) {
  Follow(records);
  if (!acknowledges_) {
    FollowQueue();
  }
  return PublishTokens(isDone);
}

// Nobody here takes tokens: a full queue drops the oldest one for each that comes. When others
// acknowledge or change settings, the driver's number is where counting starts again.
void TokenPump::FollowQueue() {
  const std::uint64_t version = requests_->HeadVersion() + requests_->SettingsVersion();
  unsigned int waiting = 0;
  if (!reader_.CountWaiting(&waiting)) {
    return;
  }
  const auto queueTokens = static_cast<unsigned int>(requests_->Framing().queueTokens);
  if (version != queueVersion_ || waiting > expectedTokens_) {
    queueVersion_ = version;
    expectedTokens_ = waiting;
  }
  for (; waiting >= queueTokens && expectedTokens_ > waiting; --expectedTokens_) {
    DropOldest();
  }
}

void TokenPump::DropOldest() {
  std::string bytes;
  if (head_) {
    bytes = head_->bytes;
    head_.reset();
  } else if (!lineTokens_.empty()) {
    bytes = lineTokens_.front().bytes;
    lineTokens_.pop_front();
  }
  events_->Publish(BytesDropped{NameOf(DropReason::kQueueFull), bytes, 0}, recordTimeUs_);
}

// Settings change behind everything that the driver was given before.
void TokenPump::FollowSettings() {
  const std::uint64_t version = requests_->SettingsVersion();
  if (version != settingsVersion_) {
    settingsVersion_ = version;
    check_.ChangeSettings(requests_->Framing());
    labeller_.ChangeSettings(requests_->Framing());
    reader_.SetHexMode(requests_->Framing().isHex);
    lineTokens_.clear();
  }
}

void TokenPump::Follow(const LineRecord& record) {
  recordTimeUs_ = record.timeUs;
  switch (record.kind) {
    case LineRecord::Kind::kServed:
      events_->Publish(BytesReceived{record.bytes}, record.timeUs);
      FollowBytes(record);
      break;
    case LineRecord::Kind::kSilence:
      FollowSilence(record.silenceMs);
      break;
    case LineRecord::Kind::kSent:
      events_->Publish(BytesSent{record.bytes, record.takenBytes}, record.timeUs);
      break;
    case LineRecord::Kind::kLost:
      events_->Publish(PortChanged{"lost", ErrorName(record.errorNumber), record.text},
                       record.timeUs);
      break;
    case LineRecord::Kind::kBack:
      events_->Publish(PortChanged{"back", "", record.text}, record.timeUs);
      break;
    case LineRecord::Kind::kMissed:
      // The driver has had them: its tokens are no longer those of the bytes that are known.
      check_.Interrupt();
      lineTokens_.clear();
      events_->Publish(NoteMade{record.text, record.missedBytes}, record.timeUs);
      break;
    case LineRecord::Kind::kNote:
      events_->Publish(NoteMade{record.text}, record.timeUs);
      break;
  }
}

void TokenPump::FollowBytes(const LineRecord& record) {
  recordFirstNs_ = record.firstArrivalNs;
  recordLastNs_ = record.lastArrivalNs;
  servedBytes_ += record.bytes.size();
  if (!frameFirstNs_) {
    frameFirstNs_ = record.firstArrivalNs;
  }
  if (acknowledges_) {
    check_.OnBytes(record.bytes);
  } else {
    labeller_.OnBytes(record.bytes);
  }
}

void TokenPump::FollowSilence(int silenceMs) {
  if (acknowledges_) {
    check_.OnSilence(silenceMs);
  } else {
    labeller_.OnSilence(silenceMs);
  }
  frameFirstNs_.reset();
}

void TokenPump::OnLabelled(const LabelledBytes& labelled) {
  if (labelled.role == ByteRole::kDropped) {
    events_->Publish(BytesDropped{NameOf(labelled.reason), labelled.bytes, labelled.afterMs},
                     recordTimeUs_);
    return;
  }
  events_->Publish(BytesLabelled{NameOf(labelled.role), labelled.bytes}, recordTimeUs_);
  frame_.bytes += labelled.bytes;
  frame_.prefixBytes += labelled.role == ByteRole::kPrefix ? labelled.bytes.size() : 0;
  frame_.suffixBytes += labelled.role == ByteRole::kSuffix ? labelled.bytes.size() : 0;
}

void TokenPump::OnCutToken(const CutToken& token) {
  const std::int64_t firstNs = frameFirstNs_.value_or(recordLastNs_);
  lineTokens_.push_back({token.bytes, std::exchange(frame_, {}),
                         std::max<std::int64_t>(recordLastNs_ - firstNs, 0) / kNsPerUs});
  ++expectedTokens_;
  frameFirstNs_.reset();
  if (token.endOffset < servedBytes_) {
    frameFirstNs_ = recordFirstNs_;  // the next frame has begun in the same piece
  }
  const auto queueTokens = static_cast<std::size_t>(std::max(requests_->Framing().queueTokens, 1));
  if (lineTokens_.size() > queueTokens + kSpareLineTokens) {
    lineTokens_.pop_front();
  }
}

void TokenPump::OnFinding(const FramingFinding& finding) {
  events_->Publish(FindingMade{finding.text, finding.driverBytes, finding.modelBytes});
}

void TokenPump::OnQueueFull(const CutToken& token) {
  events_->Publish(BytesDropped{NameOf(DropReason::kQueueFull), token.bytes, 0}, recordTimeUs_);
}

bool TokenPump::IsHeadPublished() const {
  return head_ && headVersion_ == requests_->HeadVersion();
}

std::optional<TokenReceived> TokenPump::Head() const {
  return IsHeadPublished() ? head_ : std::nullopt;
}

Answer TokenPump::PublishTokens(const std::function<bool()>& isDone) {
  ReceivedToken token;
  hasMore_ = false;
  for (int left = kMaxTokensAtOnce; !IsHeadPublished() && !isDone(); --left) {
    if (left == 0) {
      hasMore_ = true;
      return {};
    }
    const std::uint64_t version = requests_->HeadVersion();
    const TokenReader::Outcome outcome = reader_.Peek(&token);
    if (outcome == TokenReader::Outcome::kEmpty) {
      lineWait_.reset();
      check_.OnEmptyQueue();
      return {};
    }
    if (outcome == TokenReader::Outcome::kFailed) {
      return Refusal(reader_.Error());
    }
    if (MustWaitForLine(token)) {
      return {};
    }
    lineWait_.reset();
    PublishToken(token);
    if (!acknowledges_) {
      headVersion_ = version;
    } else {
      head_.reset();
      if (!reader_.Acknowledge()) {
        return Refusal(reader_.Error());
      }
      check_.OnDriverToken({token.bytes, token.lengthBytes, token.isCut});
    }
  }
  return {};
}

void TokenPump::PublishToken(const ReceivedToken& token) {
  TokenReceived detail;
  detail.number = ++tokenCount_;
  detail.bytes = token.bytes;
  detail.lengthBytes = token.lengthBytes;
  detail.isCut = token.isCut;
  (void)reader_.CountWaiting(&detail.waiting);
  AddWhatTheLineKnows(token, &detail);
  head_ = detail;
  events_->Publish(std::move(detail));
}

// The oldest token of the line with the same bytes.
std::deque<TokenPump::LineToken>::iterator TokenPump::FindOnLine(const ReceivedToken& token) {
  return std::find_if(lineTokens_.begin(), lineTokens_.end(), [&](const LineToken& candidate) {
    return token.isCut ? candidate.bytes.compare(0, token.bytes.size(), token.bytes) == 0 &&
                             candidate.bytes.size() == token.lengthBytes
                       : candidate.bytes == token.bytes;
  });
}

// For a moment only: a token that the host reads differently never shows up on the line. A queue
// that is about to lose tokens does not wait at all.
bool TokenPump::MustWaitForLine(const ReceivedToken& token) {
  unsigned int waiting = 0;
  const bool isHurried = reader_.CountWaiting(&waiting) && waiting > 1 &&
                         waiting >= static_cast<unsigned int>(requests_->Framing().queueTokens) / 2;
  if (isHurried || FindOnLine(token) != lineTokens_.end()) {
    lineWait_.reset();
    return false;
  }
  if (!lineWait_) {
    lineWait_ = Deadline::After(kLineWaitMs);
  }
  return !lineWait_->HasPassed();
}

// Tokens of the line in front of this one never reached a reader.
void TokenPump::AddWhatTheLineKnows(const ReceivedToken& token, TokenReceived* detail) {
  const auto found = FindOnLine(token);
  if (found != lineTokens_.end()) {
    detail->frame = found->frame.bytes;
    detail->prefixBytes = found->frame.prefixBytes;
    detail->suffixBytes = found->frame.suffixBytes;
    detail->durationUs = found->durationUs;
    lineTokens_.erase(lineTokens_.begin(), found + 1);
  }
}
