// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <string>

#include "host/commands/InstanceAccess.h"

namespace CLI {
class App;
}

// `loka sub`: prints tokens as they come.
struct SubOptions {
  InstanceAccess access;
  std::uint64_t count = 0;  // -C; 0: no end
  double limitSeconds = 0;  // -W; 0: no end
  std::string format;       // -F
  std::string logFile;      // --log; empty: none
  bool isJson = false;
  bool isHex = false;
  bool isDump = false;
  bool hasTime = false;
  bool isRaw = false;
  bool isPeek = false;
};

void AddSub(CLI::App* app, SubOptions* options);

// Returns the exit status of the program: 27 when -W passed before -C tokens came.
int RunSub(SubOptions* options);
