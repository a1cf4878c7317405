// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <string_view>

// How received bytes become tokens and what is put around sent ones. Empty prefix or suffix: none.
struct FramingSettings {
  static constexpr int kDefaultGapMs = 500;  // what a configured gap of 0 stands for
  static constexpr int kDefaultQueueTokens = 100;

  std::string rxPrefix;
  std::string rxSuffix;
  std::string txPrefix;
  std::string txSuffix;
  int gapMs = 0;  // as configured
  bool isHex = false;
  int queueTokens = kDefaultQueueTokens;

  // The silence in milliseconds that ends a receive.
  int SilenceMs() const { return gapMs == 0 ? kDefaultGapMs : gapMs; }

  friend bool operator==(const FramingSettings&, const FramingSettings&) = default;
};

// The bytes that the driver makes of a framing text. "none" and the empty text are no bytes; else
// each pair of characters is one byte, high half first. The console stores any text: a character
// that is no hexadecimal digit counts its code minus 87, and a single one at the end is paired with
// a zero character. Any thread.
std::string BytesOfHexText(std::string_view text);

// True for "none" and for an even number of hexadecimal digits, 0 included: the texts that the
// configuration and the tags accept. Any thread.
bool IsHexText(std::string_view text);

// The receive and transmit settings that a configuration text asks for, with the driver's defaults
// for keys that are not there. Says nothing about whether the driver accepts it. Any thread.
FramingSettings FramingOfConfiguration(const std::string& configuration);
