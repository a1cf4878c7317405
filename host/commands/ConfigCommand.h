// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include "host/framing/FramingFlags.h"

namespace CLI {
class App;
}

struct ConfigOptions {
  enum class Action { kNew, kCheck, kShow, kProfiles };

  Action action = Action::kNew;
  FramingFlags framing;           // of "new"
  std::string configurationWord;  // of "check" and "show": a text, a file or "-"
  std::string pluginFile;
};

// Adds the command "config" with "new", "check", "show" and "profiles" below it. Parsing fills
// `options`, which must outlive the application object. Main thread.
void AddConfig(CLI::App* app, ConfigOptions* options);

// Prints a configuration made of flags, lets the driver judge one, explains one key by key, or
// lists and checks the profiles.
// Returns the exit status of the program.
int RunConfig(const ConfigOptions& options);
