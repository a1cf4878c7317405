// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

#include "host/commands/InstanceAccess.h"

namespace CLI {
class App;
}

struct CmdOptions {
  InstanceAccess access;
  std::vector<std::string> words;  // the console command, joined with one blank
};

void AddCmd(CLI::App* app, CmdOptions* options);

// Removes the words of a console command from those of the command line and returns them: they
// start at the first one that is no option, no option's value and no port, and end with the line,
// so that a word may look like an option.
std::vector<std::string> CutConsoleWords(const CLI::App& command, std::vector<std::string>* words);

// Runs one console command of the driver: on the running instance when there is one, else on an
// instance of its own, which lives as long as the command. What only describes the driver (help,
// xml, getmaxtm) needs none. The port is opened only for commands that need it; what was done is
// told on stderr. The reply goes to stdout, or to stderr when the driver's result is false. Returns
// the exit status of the program.
int RunCmd(CmdOptions* options);
