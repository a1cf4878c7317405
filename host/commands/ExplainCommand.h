// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

#include "host/framing/FramingFlags.h"

namespace CLI {
class App;
}

// What the command line says about an explanation.
struct ExplainOptions {
  FramingFlags framing;
  std::string configurationWord;  // --config, empty when not given
  std::vector<std::string> input;
  bool hasWords = false;  // --words
  bool isJson = false;
  bool isChecked = false;  // --check
  std::string colour = "auto";
  std::string pluginFile;
};

// Adds the command "explain". Parsing fills `options`, which must outlive the application object.
// Main thread.
void AddExplain(CLI::App* app, ExplainOptions* options);

// Says of every byte of the input what the framing makes of it, on stdout; the framing in effect,
// hints and the sum on stderr. Returns the exit status of the program.
int RunExplain(const ExplainOptions& options);
