// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include "host/commands/InstanceAccess.h"

namespace CLI {
class App;
}

// `loka connect`: opens and closes the port of a driver, or says how it is.
struct ConnectOptions {
  InstanceAccess access;
  std::string state;
  bool isJson = false;
};

void AddConnect(CLI::App* app, ConnectOptions* options);

// Returns the exit status of the program: 0, too, when there was nothing to change.
int RunConnect(ConnectOptions* options);
