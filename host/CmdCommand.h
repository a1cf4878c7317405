// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

#include "host/InstanceOptions.h"

struct CmdOptions {
  InstanceOptions instance;
  std::vector<std::string> words;  // the console command, joined with one blank
  std::string instanceName;        // --instance; empty: the only one, or that of the port
  bool isAttachRefused = false;    // --no-attach
};

// Runs one console command of the driver: on the running instance when there is one, else on an
// instance of its own, which lives as long as the command. What only describes the driver (help,
// xml, getmaxtm) needs none. The port is opened only for commands that need it; what was done is
// told on stderr. The
// reply goes to stdout, or to stderr when the driver's result is false. Returns the exit status of
// the program.
int RunCmd(const CmdOptions& options);
