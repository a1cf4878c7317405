// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>

// Which faults a line has. Percentages from 0 to 100.
struct FaultOptions {
  double dropPrefixPercent = 0;  // of the messages
  double dropSuffixPercent = 0;  // of the messages
  double noisePercent = 0;       // of the bytes have a random one in front
  double flipPercent = 0;        // of the bytes have one wrong bit
  std::size_t pieces = 1;        // each message goes out in so many pieces
  int pauseMs = 0;               // between two of them
  std::size_t tooLongBytes = 0;  // length of a body that is too long; 0: none is
  double tooLongPercent = 100;   // of the messages have it
  int baud = 0;                  // rate at which bytes go out, ten bits a byte; 0: at once
};
