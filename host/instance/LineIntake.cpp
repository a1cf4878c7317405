// SPDX-License-Identifier: Apache-2.0
#include "host/instance/LineIntake.h"

#include <chrono>
#include <utility>

#include "host/base/Deadline.h"
#include "host/base/Nanoseconds.h"
#include "host/events/WallClock.h"

namespace {

// What may wait for a serving thread that is busy. Beyond it bytes are counted, not kept: the
// driver has them all the same.
constexpr std::size_t kMaxKeptBytes = std::size_t{8} * 1024 * 1024;
// A device that sends byte by byte makes a record of each.
constexpr std::size_t kMaxKeptRecords = 100000;

std::int64_t MonotonicNs() {
  return std::chrono::duration_cast<std::chrono::nanoseconds>(
             std::chrono::steady_clock::now().time_since_epoch())
      .count();
}

// The time of day of a moment on the monotonic clock.
std::int64_t WallOf(std::int64_t monotonicNs) {
  return WallClockUs() - (MonotonicNs() - monotonicNs) / kNsPerUs;
}

}  // namespace

void LineIntake::Add(LineRecord record) {
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    // Once bytes are missing, those behind them would be read as their continuation.
    const bool isFull = missedBytes_ > 0 || keptBytes_ + record.bytes.size() > kMaxKeptBytes ||
                        records_.size() >= kMaxKeptRecords;
    if (isFull && !record.bytes.empty()) {
      missedBytes_ += record.bytes.size();
      return;
    }
    keptBytes_ += record.bytes.size();
    records_.push_back(std::move(record));
  }
  // With the mutex free: the serving thread would wake up only to wait for it.
  changed_.notify_all();
}

void LineIntake::OnServed(std::string_view bytes, std::int64_t firstArrivalNs,
                          std::int64_t lastArrivalNs) {
  LineRecord record;
  record.kind = LineRecord::Kind::kServed;
  record.timeUs = WallOf(lastArrivalNs);
  record.firstArrivalNs = firstArrivalNs;
  record.lastArrivalNs = lastArrivalNs;
  record.bytes = bytes;
  Add(std::move(record));
}

// The driver has used up what came. It may queue a token now, or once a silence has ended it; the
// serving thread looks both times. Later silences of a quiet line wake nobody.
void LineIntake::OnReceivePause(const ReceiveProgress& progress) {
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    if (progress.receivedBytes != seenBytes_) {
      seenBytes_ = progress.receivedBytes;
      pausesToTell_ = 2;
    }
    if (pausesToTell_ == 0) {
      return;
    }
    --pausesToTell_;
    isWoken_ = true;
  }
  changed_.notify_all();
}

void LineIntake::OnSilence(int timeoutMs) {
  {
    // One silence behind bytes is news; those that follow are the same silence going on.
    const std::lock_guard<std::mutex> lock(mutex_);
    if (!records_.empty() && records_.back().kind == LineRecord::Kind::kSilence) {
      return;
    }
    if (records_.empty() && lastKind_ == LineRecord::Kind::kSilence) {
      return;
    }
  }
  LineRecord record;
  record.kind = LineRecord::Kind::kSilence;
  record.timeUs = WallClockUs();
  record.silenceMs = timeoutMs;
  Add(std::move(record));
}

void LineIntake::OnSent(std::string_view bytes, std::size_t takenBytes) {
  LineRecord record;
  record.kind = LineRecord::Kind::kSent;
  record.timeUs = WallClockUs();
  record.bytes = bytes;
  record.takenBytes = takenBytes;
  Add(std::move(record));
}

void LineIntake::OnLineLost(const std::string& path, const std::string& why, int errorNumber) {
  AddLoss(path + ": line lost (" + why + "); waiting for it to come back", errorNumber);
}

void LineIntake::OnLineGone(const std::string& path, const std::string& why, int errorNumber) {
  AddLoss(path + ": line lost (" + why + ")", errorNumber);
}

void LineIntake::AddLoss(const std::string& text, int errorNumber) {
  LineRecord record;
  record.kind = LineRecord::Kind::kLost;
  record.timeUs = WallClockUs();
  record.text = text;
  record.errorNumber = errorNumber;
  Add(std::move(record));
}

void LineIntake::OnLineBack(const std::string& path) {
  LineRecord record;
  record.kind = LineRecord::Kind::kBack;
  record.timeUs = WallClockUs();
  record.text = path + ": line is back, opened again with the same settings";
  Add(std::move(record));
}

void LineIntake::OnPortNote(const std::string& text) {
  LineRecord record;
  record.timeUs = WallClockUs();
  record.text = text;
  Add(std::move(record));
}

void LineIntake::RequestStop(int signalNumber) {
  const std::lock_guard<std::mutex> lock(mutex_);
  if (stopSignal_ == 0) {
    stopSignal_ = signalNumber;
  }
  changed_.notify_all();
}

int LineIntake::StopSignal() const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return stopSignal_;
}

void LineIntake::Wake() {
  const std::lock_guard<std::mutex> lock(mutex_);
  isWoken_ = true;
  changed_.notify_all();
}

std::vector<LineRecord> LineIntake::Take(const Deadline& deadline) {
  std::unique_lock<std::mutex> lock(mutex_);
  (void)changed_.wait_for(lock, deadline.Remaining(),
                          [this] { return !records_.empty() || isWoken_ || stopSignal_ != 0; });
  isWoken_ = false;
  keptBytes_ = 0;
  std::vector<LineRecord> taken;
  taken.swap(records_);
  if (!taken.empty()) {
    lastKind_ = taken.back().kind;
  }
  if (missedBytes_ > 0) {
    LineRecord record;
    record.kind = LineRecord::Kind::kMissed;
    record.timeUs = WallClockUs();
    record.text = std::to_string(missedBytes_) + " bytes came too fast to be shown one by one";
    record.missedBytes = std::exchange(missedBytes_, 0);
    taken.push_back(std::move(record));
  }
  return taken;
}
