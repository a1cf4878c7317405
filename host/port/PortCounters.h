// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

// What the line itself has counted (TIOCGICOUNT, tty_ioctl(4)) since the port was opened, all
// openings after an unplugging added up.
struct LineErrors {
  bool areKnown = false;  // false: the line does not count, as pseudo-terminals do not
  std::uint64_t framing = 0;
  std::uint64_t parity = 0;
  std::uint64_t overruns = 0;        // of the chip
  std::uint64_t breaks = 0;          // conditions that some adapters also report for framing errors
  std::uint64_t bufferOverruns = 0;  // of the kernel, when nobody read in time
};

// Counts of one port since it was opened.
struct PortCounters {
  std::uint64_t receivedBytes = 0;   // from the line, echo that was taken out included
  std::uint64_t servedBytes = 0;     // handed to the driver
  std::uint64_t sentBytes = 0;       // taken by the line
  std::uint64_t sends = 0;           // calls of Send with something to send
  std::uint64_t lostSends = 0;       // those of which the line did not take everything
  std::uint64_t lostSendBytes = 0;   // and the bytes that it did not take
  std::uint64_t lostBytes = 0;       // received, but not kept for want of memory
  std::uint64_t losses = 0;          // times the line was lost
  std::uint64_t reconnects = 0;      // times it came back
  std::uint64_t lostMs = 0;          // time without a line, the current loss included
  std::uint64_t echoBytes = 0;       // own bytes taken out of what was received
  std::uint64_t echoMismatches = 0;  // times something else came than what was sent
  LineErrors lineErrors;
};

LineErrors& operator+=(LineErrors& sum, const LineErrors& more);
PortCounters& operator+=(PortCounters& sum, const PortCounters& more);
