// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

#include "host/InstanceOptions.h"

struct CmdOptions {
  InstanceOptions instance;
  std::vector<std::string> words;  // the console command, joined with one blank
};

// Runs one console command of the driver on an instance of its own, which lives as long as the
// command. The port is opened only for commands that need it; what was done is told on stderr. The
// reply goes to stdout, or to stderr when the driver's result is false. Returns the exit status of
// the program.
int RunCmd(const CmdOptions& options);
