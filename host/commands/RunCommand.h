// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include "host/commands/InstanceAccess.h"

namespace CLI {
class App;
}

// `loka run`: owns a port and stays, for other commands to attach to.
struct RunOptions {
  InstanceAccess access;
  std::string acknowledge = "auto";  // --ack auto|never
  std::string logFile;               // --log; empty: none
};

void AddRun(CLI::App* app, RunOptions* options);
int RunRun(RunOptions* options);

// `loka stats`: the counters of a running instance.
struct StatsOptions {
  InstanceAccess access;
  bool isJson = false;
};

void AddStats(CLI::App* app, StatsOptions* options);
int RunStats(StatsOptions* options);
