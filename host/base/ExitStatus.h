// SPDX-License-Identifier: Apache-2.0
#pragma once

// What the program's exit status tells a script. A program ended by signal n exits with 128 + n.
enum class ExitStatus : int {
  kDone = 0,
  kRefused = 1,        // the driver, a tag or the store refused; the text is on stderr
  kUsage = 2,          // the command line is not right
  kPlugin = 3,         // the plug-in cannot be loaded or lacks an interface or a description
  kConfiguration = 4,  // the driver rejects the configuration
  kPort = 5,           // the port cannot be opened or set up
  kPortLost = 6,       // the line was lost and reconnect=off
  kDifference = 7,     // the driver and the host read the same bytes differently
  kTimeout = 27,       // what was waited for did not come in time
  kFirstSignal = 128,
};
