// SPDX-License-Identifier: Apache-2.0
#include "host/framing/FramingCheck.h"

#include <algorithm>
#include <unordered_map>

#include "host/text/ByteText.h"

namespace {

// Tokens of one side that wait for the other one, at most. A line without any silence and a driver
// that disagrees would otherwise collect them for ever.
constexpr std::size_t kMaxBacklog = 2000;

std::size_t QueueTokens(const FramingSettings& settings) {
  // The driver keeps one token where the number is smaller than that.
  return static_cast<std::size_t>(std::max(settings.queueTokens, 1));
}

bool IsSame(const DriverToken& driver, const std::string& model) {
  if (driver.isCut) {
    return driver.lengthBytes == model.size() && driver.bytes.size() < model.size() &&
           model.compare(0, driver.bytes.size(), driver.bytes) == 0 &&
           model[driver.bytes.size()] == '\0';
  }
  return driver.bytes == model;
}

std::string Quoted(const std::string& bytes) { return "\"" + EscapeBytes(bytes) + "\""; }

}  // namespace

FramingCheck::FramingCheck(const FramingSettings& settings, CheckSink* sink)
    : sink_(sink), labeller_(settings, this), queueTokens_(QueueTokens(settings)) {}

void FramingCheck::OnLabelled(const LabelledBytes& labelled) { sink_->OnLabelled(labelled); }

void FramingCheck::OnCutToken(const CutToken& token) {
  sink_->OnCutToken(token);
  if (state_ == State::kUnsure) {
    return;
  }
  expected_.push_back(token);
  ++cutsSinceEven_;
  LimitBacklog();
}

void FramingCheck::OnBytes(std::string_view bytes) {
  // The driver asks for a byte only after it has queued the token in front of it.
  queued_ = expected_.size();
  labeller_.OnBytes(bytes);
  CompareWhatIsThere();
}

void FramingCheck::OnSilence(int waitedMs) {
  queued_ = expected_.size();
  CompareWhatIsThere();
  DecideAtSilence();
  if (state_ == State::kComparing && expected_.empty()) {
    cutsSinceEven_ = 0;
  }
  // What this silence cuts belongs to a pass that began before it.
  labeller_.OnSilence(waitedMs);
  if (state_ == State::kUnsure) {
    state_ = State::kSearching;
  }
}

void FramingCheck::OnDisconnected() {
  labeller_.OnDisconnected();
  Interrupt();
}

void FramingCheck::Interrupt() {
  state_ = State::kUnsure;
  expected_.clear();
  taken_.clear();
  queued_ = 0;
  foundMissing_ = 0;
  isFoundLast_ = false;
  cutsSinceEven_ = 0;
}

void FramingCheck::ChangeSettings(const FramingSettings& settings) {
  labeller_.ChangeSettings(settings);
  queueTokens_ = QueueTokens(settings);
  Interrupt();
}

void FramingCheck::OnDriverToken(const DriverToken& token) {
  if (state_ == State::kUnsure) {
    return;
  }
  taken_.push_back(token);
  CompareWhatIsThere();
  LimitBacklog();
}

// A token that was in the queue at one empty queue's time and is still expected at the next one
// was never handed out: the second question was asked after the first one was answered.
void FramingCheck::OnEmptyQueue() {
  if (foundMissing_ > 0 && taken_.empty()) {
    if (state_ == State::kComparing && !MayHaveOverflowed()) {
      Report(
          FramingFinding::Kind::kMissing,
          "the driver did not queue " + Quoted(expected_.front().bytes) +
              (foundMissing_ > 1 ? " and " + std::to_string(foundMissing_ - 1) + " more behind it"
                                 : ""));
      for (std::size_t left = foundMissing_; left > 0; --left) {
        PopExpected();
      }
    } else {
      LoseFront(foundMissing_);
    }
  }
  foundMissing_ = queued_;
}

void FramingCheck::CompareWhatIsThere() {
  while (state_ == State::kComparing && !taken_.empty() && !expected_.empty()) {
    if (IsMatch(0, 0)) {
      isFoundLast_ = isFoundLast_ && taken_.front().bytes == found_;
      ++comparedTokens_;
      PopExpected();
      taken_.pop_front();
    } else if (expected_.size() > queueTokens_) {
      // As many newer tokens as the queue holds push the oldest one out.
      LoseFront(1);
    } else {
      return;
    }
  }
}

// Older tokens may still come out of the queue in front of the first comparable one.
bool FramingCheck::Search() {
  std::unordered_map<std::string_view, std::size_t> places;
  for (std::size_t i = 0; i < expected_.size(); ++i) {
    places.emplace(expected_[i].bytes, i);
  }
  for (std::size_t i = 0; i < taken_.size(); ++i) {
    const auto place = places.find(taken_[i].bytes);
    if (!taken_[i].isCut && place == places.end()) {
      continue;
    }
    const std::size_t found = taken_[i].isCut ? FindExpected(i) : place->second;
    if (found == expected_.size()) {
      continue;
    }
    StartComparing(i, found);
    return true;
  }
  return false;
}

void FramingCheck::StartComparing(std::size_t takenIndex, std::size_t expectedIndex) {
  found_ = taken_[takenIndex].bytes;
  isFoundLast_ = true;
  ++comparedTokens_;
  for (std::size_t left = expectedIndex + 1; left > 0; --left) {
    PopExpected();
  }
  taken_.erase(taken_.begin(), taken_.begin() + static_cast<std::ptrdiff_t>(takenIndex + 1));
  state_ = State::kComparing;
}

// All bytes of the tokens that were taken so far are known.
void FramingCheck::DecideAtSilence() {
  while (!taken_.empty()) {
    if (state_ == State::kSearching && !Search()) {
      break;
    }
    CompareWhatIsThere();
    if (!taken_.empty()) {
      DecideFront();
    }
  }
  taken_.clear();
}

void FramingCheck::DecideFront() {
  if (IsRepeatOfFound()) {
    // The search took an older token with the same bytes for the expected one.
    taken_.pop_front();
    return;
  }
  if (expected_.empty()) {
    Report(FramingFinding::Kind::kExtra,
           "the driver has a token " + Quoted(taken_.front().bytes) + " that no frame gives");
    taken_.pop_front();
    return;
  }
  const std::size_t found = FindExpected(0);
  if (found < expected_.size()) {
    if (!MayHaveOverflowed()) {
      Report(FramingFinding::Kind::kMissing,
             "the driver did not queue " + Quoted(expected_.front().bytes) +
                 (found > 1 ? " and " + std::to_string(found - 1) + " more behind it" : ""));
      for (std::size_t left = found; left > 0; --left) {
        PopExpected();
      }
    } else {
      LoseFront(found);
    }
    return;
  }
  if (taken_.size() > 1 && IsMatch(1, 0)) {
    Report(FramingFinding::Kind::kExtra,
           "the driver has a token " + Quoted(taken_.front().bytes) + " that no frame gives");
    taken_.pop_front();
    return;
  }
  Report(FramingFinding::Kind::kDifferent, "the driver has " + Quoted(taken_.front().bytes) +
                                               " where " + Quoted(expected_.front().bytes) +
                                               " is expected");
  PopExpected();
  taken_.pop_front();
  state_ = State::kSearching;
}

bool FramingCheck::IsMatch(std::size_t takenIndex, std::size_t expectedIndex) const {
  return IsSame(taken_[takenIndex], expected_[expectedIndex].bytes);
}

// The first expected token that this one is; the number of expected ones when it is none.
std::size_t FramingCheck::FindExpected(std::size_t takenIndex) const {
  std::size_t index = 0;
  while (index < expected_.size() && !IsMatch(takenIndex, index)) {
    ++index;
  }
  return index;
}

bool FramingCheck::IsRepeatOfFound() const {
  return isFoundLast_ && taken_.front().bytes == found_;
}

// Equal tokens can be taken for each other, so what is left over need not be what was pushed out.
bool FramingCheck::MayHaveOverflowed() const { return cutsSinceEven_ > queueTokens_; }

void FramingCheck::LoseFront(std::size_t count) {
  for (; count > 0; --count) {
    if (state_ == State::kComparing) {
      sink_->OnQueueFull(expected_.front());
    }
    PopExpected();
  }
}

void FramingCheck::PopExpected() {
  expected_.pop_front();
  queued_ -= queued_ > 0 ? 1 : 0;
  foundMissing_ -= foundMissing_ > 0 ? 1 : 0;
}

void FramingCheck::LimitBacklog() {
  if (expected_.size() > queueTokens_ + kMaxBacklog) {
    LoseFront(1);
  }
  if (taken_.size() > kMaxBacklog) {
    DecideAtSilence();
  }
}

void FramingCheck::Report(FramingFinding::Kind kind, const std::string& text) {
  FramingFinding finding;
  finding.kind = kind;
  finding.text = text;
  if (kind != FramingFinding::Kind::kMissing) {
    finding.driverBytes = taken_.front().bytes;
  }
  if (kind != FramingFinding::Kind::kExtra) {
    finding.modelBytes = expected_.front().bytes;
    finding.offset = expected_.front().offset;
  }
  ++findings_;
  sink_->OnFinding(finding);
}
