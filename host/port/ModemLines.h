// SPDX-License-Identifier: Apache-2.0
#pragma once

// Levels of a line's modem signals (TIOCMGET, ioctl_tty(2)).
struct ModemLines {
  bool areKnown = false;  // false: the line has none, as pseudo-terminals do not, or is lost
  bool dtr = false;       // ours
  bool rts = false;
  bool cts = false;  // the other end's
  bool dsr = false;
  bool dcd = false;
  bool ri = false;
};
