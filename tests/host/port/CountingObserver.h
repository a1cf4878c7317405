// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <gtest/gtest.h>

#include <algorithm>
#include <condition_variable>
#include <mutex>
#include <string>
#include <vector>

#include "host/base/Deadline.h"
#include "host/port/ErrorName.h"
#include "host/port/PortObserver.h"

// Remembers what a port tells and lets a test wait for it.
class CountingObserver final : public PortObserver {
 public:
  void OnReceivePause(const ReceiveProgress& progress) override {
    const std::lock_guard<std::mutex> lock(mutex_);
    progress_ = progress;
    ++pauses_;
    changed_.notify_all();
  }
  void OnLineLost(const std::string& path, const std::string& why, int errorNumber) override {
    OnPortNote("lost " + path + ": " + why + " " + ErrorName(errorNumber));
  }
  void OnLineBack(const std::string& path) override { OnPortNote("back " + path); }
  void OnPortNote(const std::string& text) override {
    const std::lock_guard<std::mutex> lock(mutex_);
    notes_.push_back(text);
    changed_.notify_all();
  }

  void OnServed(std::string_view bytes, std::int64_t firstArrivalNs,
                std::int64_t lastArrivalNs) override {
    EXPECT_GT(firstArrivalNs, 0);
    EXPECT_LE(firstArrivalNs, lastArrivalNs);
    Tell(std::string(bytes));
  }
  void OnSilence(int timeoutMs) override { Tell("." + std::to_string(timeoutMs)); }
  void OnSent(std::string_view bytes, std::size_t takenBytes) override {
    Tell(">" + std::string(bytes) + "(" + std::to_string(takenBytes) + ")");
  }

  // Bytes served, ".T" for a silence of T ms, ">bytes(taken)" for a send; the last 200 characters.
  std::string Story() const {
    const std::lock_guard<std::mutex> lock(mutex_);
    return story_;
  }
  int Pauses() const {
    const std::lock_guard<std::mutex> lock(mutex_);
    return pauses_;
  }
  ReceiveProgress Progress() const {
    const std::lock_guard<std::mutex> lock(mutex_);
    return progress_;
  }
  std::vector<std::string> Notes() const {
    const std::lock_guard<std::mutex> lock(mutex_);
    return notes_;
  }
  // Waits until so many notes have come, lost and back included.
  bool AwaitNotes(std::size_t count, int limitMs) {
    std::unique_lock<std::mutex> lock(mutex_);
    return changed_.wait_for(lock, Deadline::After(limitMs).Remaining(),
                             [&] { return notes_.size() >= count; });
  }
  // Waits until a further pause begins.
  bool AwaitPause(int limitMs) {
    std::unique_lock<std::mutex> lock(mutex_);
    const int before = pauses_;
    return changed_.wait_for(lock, Deadline::After(limitMs).Remaining(),
                             [&] { return pauses_ > before; });
  }
  // Waits until the driver has worked off so many bytes.
  bool AwaitBytes(std::uint64_t count, int limitMs) {
    std::unique_lock<std::mutex> lock(mutex_);
    return changed_.wait_for(lock, Deadline::After(limitMs).Remaining(),
                             [&] { return progress_.receivedBytes >= count; });
  }

 private:
  void Tell(const std::string& text) {
    constexpr std::size_t kMostCharacters = 200;
    const std::lock_guard<std::mutex> lock(mutex_);
    story_ += text;
    story_.erase(0, story_.size() - std::min(story_.size(), kMostCharacters));
  }

  mutable std::mutex mutex_;
  std::condition_variable changed_;
  int pauses_ = 0;
  ReceiveProgress progress_;
  std::vector<std::string> notes_;
  std::string story_;
};
