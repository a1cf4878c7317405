// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

#include "driver/TokenFramer.h"

// One of the framing drawings, as far as it can be compared with the framer.
struct Drawing {
  // Something that happens on the line.
  struct Event {
    enum class Kind { kByte, kPause };
    Kind kind = Kind::kByte;
    unsigned char byte = 0;
    int count = 1;     // of the byte
    int pauseMs = 0;   // of the pause
    std::string role;  // of the byte: "prefix", "suffix", "body", "drop"
    int queued = 0;    // tokens that enter the queue with it, as drawn
  };

  RxFraming framing;
  int gapMs = 0;  // as set
  std::vector<Event> events;
  std::vector<std::string> tokens;  // as labelled, in order

  static Drawing From(const std::string& svg);
};
