// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

#include "host/PortMap.h"

struct WatchOptions {
  std::vector<std::string> portWords;  // --port, as given
  std::string configuration;
  std::string pluginFile;
  std::string storeFile;  // empty: the default file
  bool withoutStore = false;
  std::string ident;  // empty: the configured port name
  bool isVerbose = false;
};

// Shows each token that a device sends until a signal ends it: one line on stdout with time, length
// in bytes, text and bytes in hexadecimal; everything else goes to stderr. Each token is
// acknowledged once it is printed. Returns the exit status of the program.
int RunWatch(const WatchOptions& options);
