// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include "host/commands/InstanceAccess.h"

namespace CLI {
class App;
}

// `loka term`: a terminal on a port. Owns the port as `run` does, or attaches to an instance that
// does.
struct TermOptions {
  InstanceAccess access;
  std::string acknowledge = "auto";  // --ack auto|never
  std::string inputMode = "text";    // --input, a name of kInputModeNames
  std::string outputMode = "text";   // --output, a name of kOutputModeNames
  std::string logFile;               // --log; empty: none yet
  bool hasTime = false;              // -t
  double lingerSeconds = 0.5;        // -W, behind the end of an input that is no terminal
};

void AddTerm(CLI::App* app, TermOptions* options);

// Returns the exit status of the program.
int RunTerm(TermOptions* options);
