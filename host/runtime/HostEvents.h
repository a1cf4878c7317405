// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <condition_variable>
#include <cstdint>
#include <functional>
#include <mutex>
#include <string>

#include "host/port/PortObserver.h"

class Deadline;

// Where a command waits for whatever may happen: bytes that the driver has worked off, a line that
// was lost, a request to stop. Spares polling the tags: after a silent line's last news nobody is
// woken. Any thread.
class HostEvents final : public PortObserver {
 public:
  // The handler gets each note and line change as one line, on the thread on which it happens.
  using NoteHandler = std::function<void(const std::string& text)>;
  explicit HostEvents(NoteHandler onNote);

  void OnReceivePause(const ReceiveProgress& progress) override;
  void OnLineLost(const std::string& path, const std::string& why, int errorNumber) override;
  void OnLineGone(const std::string& path, const std::string& why, int errorNumber) override;
  void OnLineBack(const std::string& path) override;
  void OnPortNote(const std::string& text) override;

  // Asks the waiting command to stop because of a signal; the first one counts.
  void RequestStop(int signalNumber);

  // The signal that asked to stop, or 0.
  int StopSignal() const;

  // Waits until condition() holds, asked at first, at every event and every 100 ms. False when the
  // deadline has passed first or a stop was requested.
  bool WaitUntil(const std::function<bool()>& condition, const Deadline& deadline);

  // Waits until the receiver has seen `count` more silences.
  bool WaitForSilences(std::uint64_t count, const Deadline& deadline);

  // The last progress that was reported.
  ReceiveProgress Progress() const;

 private:
  const NoteHandler onNote_;

  mutable std::mutex mutex_;
  std::condition_variable changed_;
  std::uint64_t eventCount_ = 0;
  ReceiveProgress progress_;
  int pausesToTell_ = 0;
  int silenceWaiters_ = 0;
  int stopSignal_ = 0;
};
