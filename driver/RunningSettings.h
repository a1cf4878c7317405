// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <atomic>
#include <string>

#include "driver/SerialSettings.h"
#include "driver/TokenFramer.h"
#include "protlib/LeafMutex.h"

// The four framing texts, as hex text.
enum class FramingText { kRxPrefix, kRxSuffix, kTxPrefix, kTxSuffix };

// The receive framing as bytes, with the state of the settings from which it was made.
struct RxFramingSnapshot {
  unsigned int version = 0;
  RxFraming framing;
};

// The settings in effect while the protocol runs. Host threads and the console change them while
// the receive task reads them, without any semaphore of the host; so each one is atomic or guarded
// here.
class RunningSettings {
 public:
  SerialSettings Serial() const;
  void SetSerial(const SerialSettings& serial);

  std::string Text(FramingText which) const;
  void SetText(FramingText which, std::string text);

  // Milliseconds of silence that end a token; 0 stands for kDefaultGapMs.
  int GapMs() const { return gapMs_; }
  void SetGapMs(int gapMs) { gapMs_ = gapMs; }

  // Whether tokens are given and shown as hexadecimal text.
  bool HexTokens() const { return hexTokens_; }
  void SetHexTokens(bool hexTokens) { hexTokens_ = hexTokens; }

  // The most tokens kept.
  int TokenQueueSize() const { return tokenQueueSize_; }
  void SetTokenQueueSize(int tokens) { tokenQueueSize_ = tokens; }

  // Brings the snapshot up to date; cheap while nothing has changed.
  void UpdateRxFraming(RxFramingSnapshot& snapshot) const;

 private:
  static constexpr std::size_t kFramingTexts = 4;

  std::atomic<int> gapMs_{0};
  std::atomic<bool> hexTokens_{false};
  std::atomic<int> tokenQueueSize_{0};
  std::atomic<unsigned int> rxVersion_{0};

  mutable LeafMutex mutex_;
  SerialSettings serial_ LOKA_GUARDED_BY(mutex_);
  std::array<std::string, kFramingTexts> texts_ LOKA_GUARDED_BY(mutex_);
};
