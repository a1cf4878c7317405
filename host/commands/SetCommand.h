// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

#include "host/commands/InstanceAccess.h"

namespace CLI {
class App;
}

// `loka set`: stages run-time settings and makes them active, or shows them.
struct SetOptions {
  InstanceAccess access;
  std::vector<std::string> words;  // KEY=VALUE
  bool isStageOnly = false;
  bool isShown = false;
  bool isJson = false;
};

void AddSet(CLI::App* app, SetOptions* options);

// Returns the exit status of the program. Nothing is staged unless every value is right.
int RunSet(SetOptions* options);
