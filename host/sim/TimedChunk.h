// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <chrono>
#include <string>
#include <vector>

// Bytes that go out together.
struct TimedChunk {
  std::chrono::nanoseconds offset{0};  // from the begin of the message
  std::string bytes;
  // In front of it lies a pause that must not get shorter when the sender is late. Other chunks
  // catch up.
  bool isBehindPause = false;
};

// A message as it goes over the line.
struct WireMessage {
  std::vector<TimedChunk> chunks;   // in the order of their offsets
  std::vector<std::string> faults;  // names of the faults that it has: "drop-suffix" and the like
  std::chrono::nanoseconds length{0};  // until the line is free again
};
