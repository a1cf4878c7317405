// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

namespace CLI {
class App;
}

// What "ports" takes from the command line.
struct PortsOptions {
  bool isLong = false;
  bool asJson = false;
  // Where the system keeps its lists; other folders only in tests.
  std::string classFolder = "/sys/class/tty";
  std::string deviceRoot = "/dev";
};

// Adds the command. Parsing fills `options`, which must outlive the application object. Main
// thread.
void AddPorts(CLI::App* app, PortsOptions* options);

// Lists the serial ports of this machine on stdout, each with the word to give to --port; when
// there is none, that is said on stderr. Returns the exit status of the program.
int RunPorts(const PortsOptions& options);
