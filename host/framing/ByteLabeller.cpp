// SPDX-License-Identifier: Apache-2.0
#include "host/framing/ByteLabeller.h"

#include <algorithm>
#include <utility>

namespace {

// Strays are told in pieces of this size at the latest, so that their number has no bound.
constexpr std::size_t kMaxStrayBytes = 256;

}  // namespace

ByteLabeller::ByteLabeller(FramingSettings settings, LabelSink* sink)
    : sink_(sink), current_(std::move(settings)), next_(current_) {}

void ByteLabeller::OnBytes(std::string_view bytes) {
  isAsked_ = true;
  for (const char byte : bytes) {
    window_ += byte;
    Decide();
  }
}

void ByteLabeller::OnSilence(int waitedMs) {
  isAsked_ = true;
  TellStrays();
  const std::size_t prefixBytes = current_.rxPrefix.size();
  if (window_.size() < prefixBytes) {
    DropWindow(DropReason::kPartialPrefix, waitedMs);
  } else if (!current_.rxSuffix.empty()) {
    DropWindow(DropReason::kNoSuffix, waitedMs);
  } else if (window_.size() == prefixBytes) {
    DropWindow(DropReason::kNoBody, waitedMs);
  } else {
    CutAtSilence(waitedMs);
  }
  BeginPass();
}

void ByteLabeller::OnDisconnected() {
  TellStrays();
  DropWindow(DropReason::kDisconnected, 0);
  isAsked_ = false;
  BeginPass();
}

void ByteLabeller::ChangeSettings(const FramingSettings& settings) {
  next_ = settings;
  if (!isAsked_) {
    BeginPass();
  }
}

void ByteLabeller::BeginPass() { current_ = next_; }

// The window has just grown by one byte.
void ByteLabeller::Decide() {
  const std::string& prefix = current_.rxPrefix;
  const std::size_t last = window_.size() - 1;
  if (last >= prefix.size()) {
    DecideBody();
  } else if (window_[last] != prefix[last]) {
    BreakOffPrefix();
  }
}

// The search goes on at the byte that does not fit, and only there: what stood in front of it is
// not looked at again, even if the prefix could begin inside it.
void ByteLabeller::BreakOffPrefix() {
  const char byte = window_.back();
  const bool isRestart = byte == current_.rxPrefix.front();
  if (window_.size() == 1) {
    AddStray(byte);
    return;
  }
  TellStrays();
  const std::size_t dropped = window_.size() - (isRestart ? 1 : 0);
  Tell(0, dropped, ByteRole::kDropped, DropReason::kPrefixRestart);
  RemoveFromWindow(dropped);
}

void ByteLabeller::DecideBody() {
  const std::size_t prefixBytes = current_.rxPrefix.size();
  const std::size_t suffixBytes = current_.rxSuffix.size();
  if (suffixBytes > 0) {
    if (window_.size() >= prefixBytes + suffixBytes && EndsWith(current_.rxSuffix)) {
      CutAtSuffix();
      return;
    }
  } else if (prefixBytes > 0 && EndsWith(current_.rxPrefix)) {
    CutAtNextPrefix();
  }
  if (window_.size() > kMaxFrameBytes) {
    DropWindow(DropReason::kOver1000, 0);
    BeginPass();
  }
}

void ByteLabeller::CutAtSuffix() {
  const std::size_t bodyEnd = window_.size() - current_.rxSuffix.size();
  Tell(0, current_.rxPrefix.size(), ByteRole::kPrefix);
  Tell(current_.rxPrefix.size(), bodyEnd, ByteRole::kBody);
  Tell(bodyEnd, window_.size(), ByteRole::kSuffix);
  TellToken(bodyEnd);
  RemoveFromWindow(window_.size());
  BeginPass();
}

// The pass goes on with the next prefix. A prefix that repeats itself may overlap the one before
// (prefix 02 02, line 02 02 02): then the token between them is empty.
void ByteLabeller::CutAtNextPrefix() {
  const std::size_t prefixBytes = current_.rxPrefix.size();
  const std::size_t nextStart = window_.size() - prefixBytes;
  const std::size_t bodyEnd = std::max(nextStart, prefixBytes);
  Tell(0, prefixBytes, ByteRole::kPrefix);
  Tell(prefixBytes, bodyEnd, ByteRole::kBody);
  TellToken(bodyEnd);
  RemoveFromWindow(nextStart);
  told_ = bodyEnd - nextStart;
}

void ByteLabeller::CutAtSilence(int waitedMs) {
  Tell(0, current_.rxPrefix.size(), ByteRole::kPrefix, DropReason::kNone, waitedMs);
  Tell(current_.rxPrefix.size(), window_.size(), ByteRole::kBody, DropReason::kNone, waitedMs);
  TellToken(window_.size());
  RemoveFromWindow(window_.size());
}

void ByteLabeller::DropWindow(DropReason reason, int afterMs) {
  Tell(0, window_.size(), ByteRole::kDropped, reason, afterMs);
  RemoveFromWindow(window_.size());
}

void ByteLabeller::AddStray(char byte) {
  strays_ += byte;
  RemoveFromWindow(1);
  if (strays_.size() >= kMaxStrayBytes) {
    TellStrays();
  }
}

void ByteLabeller::TellStrays() {
  if (strays_.empty()) {
    return;
  }
  const std::uint64_t offset = windowOffset_ - strays_.size();
  sink_->OnLabelled(
      {offset, std::exchange(strays_, {}), ByteRole::kDropped, DropReason::kNoPrefix, 0});
}

void ByteLabeller::Tell(std::size_t from, std::size_t to, ByteRole role, DropReason reason,
                        int afterMs) {
  const std::size_t start = std::max(from, told_);
  if (start >= to) {
    return;
  }
  TellStrays();
  sink_->OnLabelled(
      {windowOffset_ + start, window_.substr(start, to - start), role, reason, afterMs});
}

// The token's bytes run from behind the prefix to bodyEnd.
void ByteLabeller::TellToken(std::size_t bodyEnd) {
  const std::size_t bodyStart = current_.rxPrefix.size();
  sink_->OnCutToken({windowOffset_, windowOffset_ + window_.size(),
                     window_.substr(bodyStart, bodyEnd - bodyStart)});
}

void ByteLabeller::RemoveFromWindow(std::size_t count) {
  window_.erase(0, count);
  windowOffset_ += count;
  told_ = 0;
}

bool ByteLabeller::EndsWith(const std::string& tail) const {
  return window_.size() >= tail.size() &&
         window_.compare(window_.size() - tail.size(), tail.size(), tail) == 0;
}
