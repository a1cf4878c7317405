// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

namespace CLI {
class App;
}

struct DescribeOptions {
  std::string libraryFile;  // searched, not loaded; empty: the plug-in is loaded and asked
  std::string pluginFile;   // as on the command line; for the plug-in that is loaded
  bool asXml = false;
  bool asJson = false;
  bool asForm = false;
  bool asSchema = false;
};

void AddDescribe(CLI::App* app, DescribeOptions* options);

// Prints a driver's description: a summary, the document as it stands, JSON, a form
// for a browser or a JSON Schema of the configuration. A file that is named
// is searched for the document, whatever machine it is for, and none of its code runs; without one
// the plug-in is loaded. Returns the exit status of the program.
int RunDescribe(const DescribeOptions& options);
