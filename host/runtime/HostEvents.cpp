// SPDX-License-Identifier: Apache-2.0
#include "host/runtime/HostEvents.h"

#include <algorithm>
#include <chrono>
#include <utility>

#include "host/base/Deadline.h"
#include "host/port/ErrorName.h"

namespace {

constexpr int kAskAgainMs = 100;

std::string LossText(const std::string& why, int errorNumber) {
  const std::string name = ErrorName(errorNumber);
  return name.empty() ? why : why + ", " + name;
}

}  // namespace

HostEvents::HostEvents(NoteHandler onNote) : onNote_(std::move(onNote)) {}

void HostEvents::OnReceivePause(const ReceiveProgress& progress) {
  const std::lock_guard<std::mutex> lock(mutex_);
  if (progress.receivedBytes != progress_.receivedBytes) {
    // Told now, when the bytes are used up, and once more when a silence has ended their token.
    pausesToTell_ = 2;
  }
  progress_ = progress;
  if (pausesToTell_ > 0 || silenceWaiters_ > 0) {
    pausesToTell_ = std::max(pausesToTell_ - 1, 0);
    ++eventCount_;
    changed_.notify_all();
  }
}

void HostEvents::OnLineLost(const std::string& path, const std::string& why, int errorNumber) {
  OnPortNote(path + ": line lost (" + LossText(why, errorNumber) +
             "); waiting for it to come back");
}

void HostEvents::OnLineGone(const std::string& path, const std::string& why, int errorNumber) {
  OnPortNote(path + ": line lost (" + LossText(why, errorNumber) +
             "); not opened again (reconnect=off)");
}

void HostEvents::OnLineBack(const std::string& path) {
  OnPortNote(path + ": line is back, opened again with the same settings");
}

void HostEvents::OnPortNote(const std::string& text) {
  if (onNote_) {
    onNote_(text);
  }
}

void HostEvents::RequestStop(int signalNumber) {
  const std::lock_guard<std::mutex> lock(mutex_);
  if (stopSignal_ == 0) {
    stopSignal_ = signalNumber;
  }
  ++eventCount_;
  changed_.notify_all();
}

int HostEvents::StopSignal() const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return stopSignal_;
}

bool HostEvents::WaitUntil(const std::function<bool()>& condition, const Deadline& deadline) {
  for (;;) {
    std::uint64_t seen = 0;
    {
      const std::lock_guard<std::mutex> lock(mutex_);
      if (stopSignal_ != 0) {
        return false;
      }
      seen = eventCount_;
    }
    // Asked without the lock: the condition may call the driver.
    if (condition()) {
      return true;
    }
    if (deadline.HasPassed()) {
      return false;
    }
    std::unique_lock<std::mutex> lock(mutex_);
    const auto wait = std::min<std::chrono::nanoseconds>(deadline.Remaining(),
                                                         std::chrono::milliseconds(kAskAgainMs));
    changed_.wait_for(lock, wait, [&] { return eventCount_ != seen; });
  }
}

bool HostEvents::WaitForSilences(std::uint64_t count, const Deadline& deadline) {
  std::unique_lock<std::mutex> lock(mutex_);
  const std::uint64_t wanted = progress_.silences + count;
  ++silenceWaiters_;
  const bool isDone =
      changed_.wait_for(lock, deadline.Remaining(), [&] { return progress_.silences >= wanted; });
  --silenceWaiters_;
  return isDone;
}

ReceiveProgress HostEvents::Progress() const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return progress_;
}
