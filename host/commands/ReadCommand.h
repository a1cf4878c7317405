// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

#include "host/commands/InstanceAccess.h"

namespace CLI {
class App;
}

// `loka read`: values of tags.
struct ReadOptions {
  InstanceAccess access;
  std::vector<std::string> uris;
  bool isJson = false;
  bool isHex = false;
};

void AddRead(CLI::App* app, ReadOptions* options);

// Reads all tags, in order, and returns the exit status of the first one that is refused.
int RunRead(ReadOptions* options);
