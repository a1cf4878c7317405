// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <condition_variable>
#include <cstddef>
#include <cstdint>
#include <mutex>
#include <string>
#include <string_view>
#include <vector>

#include "host/port/PortObserver.h"

class Deadline;

// One thing that happened on the line, in the order in which the driver saw it.
struct LineRecord {
  enum class Kind { kServed, kSilence, kSent, kLost, kBack, kNote, kMissed };

  Kind kind = Kind::kNote;
  std::int64_t timeUs = 0;          // time of day at which it happened, microseconds since 1970
  std::int64_t firstArrivalNs = 0;  // kServed: of the first and the last byte, CLOCK_MONOTONIC
  std::int64_t lastArrivalNs = 0;
  std::string bytes;              // kServed, kSent
  std::size_t takenBytes = 0;     // kSent: how many the line took
  int silenceMs = 0;              // kSilence
  int errorNumber = 0;            // kLost
  std::uint64_t missedBytes = 0;  // kMissed: how many were not kept
  std::string text;               // kLost, kNote, kMissed
};

// Keeps what the port tells until the thread that serves the instance takes it. Any thread.
class LineIntake final : public PortObserver {
 public:
  void OnServed(std::string_view bytes, std::int64_t firstArrivalNs,
                std::int64_t lastArrivalNs) override;
  void OnReceivePause(const ReceiveProgress& progress) override;
  void OnSilence(int timeoutMs) override;
  void OnSent(std::string_view bytes, std::size_t takenBytes) override;
  void OnLineLost(const std::string& path, const std::string& why, int errorNumber) override;
  void OnLineGone(const std::string& path, const std::string& why, int errorNumber) override;
  void OnLineBack(const std::string& path) override;
  void OnPortNote(const std::string& text) override;

  // Asks the serving thread to stop because of a signal; the first one counts.
  void RequestStop(int signalNumber);
  int StopSignal() const;

  // Wakes the serving thread up.
  void Wake();

  // Waits until there is something to do: records, a pause of the driver, a wake-up, a stop; at the
  // longest until the deadline. Returns the records and forgets them.
  std::vector<LineRecord> Take(const Deadline& deadline);

 private:
  void Add(LineRecord record);
  void AddLoss(const std::string& text, int errorNumber);

  mutable std::mutex mutex_;
  std::condition_variable changed_;
  std::vector<LineRecord> records_;
  std::size_t keptBytes_ = 0;
  std::uint64_t missedBytes_ = 0;
  std::uint64_t seenBytes_ = 0;  // of the progress that was told last
  int pausesToTell_ = 0;
  LineRecord::Kind lastKind_ = LineRecord::Kind::kNote;  // of the record that was taken last
  bool isWoken_ = false;
  int stopSignal_ = 0;
};
