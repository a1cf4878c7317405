// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <memory>
#include <string>
#include <vector>

#include "host/framing/FramingFlags.h"
#include "host/instance/Instance.h"
#include "host/instance/InstanceOptions.h"

class LocalInstance;

namespace CLI {
class App;
}

// How a command finds its driver: the running instance of another process, which owns the port and
// answers on a control socket, or one of its own for as long as the command lasts.
struct InstanceAccess {
  InstanceOptions options;
  FramingFlags framing;
  CLI::App* command = nullptr;  // the one that has the options
  std::string portWord;         // the positional PORT
  std::string profile;          // --profile
  std::string configSource;     // --config: a file, "-" or the text itself
  std::string instanceName;     // --instance; empty: the only one, or that of the configured port
  bool isQuiet = false;         // -q
  int verbosity = 0;            // -v, counted
  std::string colour = "auto";  // --color, as TextStyle takes it
  bool isFinalLoss = false;     // --no-reconnect
  bool isAttachWanted = false;
  bool isAttachRefused = false;
  bool acknowledges = true;
  bool watches = false;  // events of an instance that runs already: all from "attached" on
  bool connects = true;
};

// Adds --color.
void AddColour(CLI::App* command, std::string* colour);

// Adds PORT, --port, --config, the framing flags, --store, --attach and the like.
void AddInstanceAccess(CLI::App* command, InstanceAccess* access, bool hasPortWord = true);

// Fills in what follows from the flags: the configuration text and the port words. False with the
// reason in `answer`.
bool Resolve(InstanceAccess* access, Answer* answer);

// Attaches or starts, as the flags say; tells on standard error which, and what a started instance
// runs with. Null with the reason in `answer`.
std::unique_ptr<Instance> OpenInstance(InstanceAccess* access, Answer* answer);

// The first half of OpenInstance alone: the running instance, told on standard error, or null; then
// `answer` says whether that is a failure.
std::unique_ptr<Instance> AttachInstance(const InstanceAccess& access, Answer* answer);

// The second half of OpenInstance alone: always an instance of its own.
std::unique_ptr<LocalInstance> BeginInstance(const InstanceAccess& access, Answer* answer);

// A refusal and its hints as lines for people: "error -1: token too long   hint: 14 bytes ...".
std::vector<std::string> DescribeAnswer(const Answer& answer);

// Tells a refusal and its hints on standard error. Returns the exit status of the program.
int TellAnswer(const Answer& answer);

// The exit status for a command that was served: 128 + n after a signal.
int EndOf(const Instance& instance, const Answer& answer);
