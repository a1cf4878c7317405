// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

namespace CLI {
class App;
}

// The commands of the program as plain data, read from the tree that the command line is parsed
// with. Completion files and manual pages are written from it, so they cannot know another option
// than the parser does.

// What can stand where a value is expected.
struct ValueWords {
  enum class Kind {
    kNothing,   // nothing that could be offered
    kChoice,    // one of `choices`
    kFile,      // a file of the user
    kPort,      // a port word
    kProfile,   // the name of a profile
    kInstance,  // the name of a running instance
    kUri,       // the address of a tag
    kConsole,   // a console command of the driver
    kKeyValue,  // one of `choices`, which end with "=", and a value behind it
  };

  Kind kind = Kind::kNothing;
  std::vector<std::string> choices;
  bool isAlsoProfile = false;  // the positional PORT takes the name of a profile as well
};

// What "loka words" is to be asked for, "ports profiles"; empty where the words are known.
std::string KindsToAskFor(const ValueWords& values);

struct OptionModel {
  std::vector<std::string> names;  // "-b", "--baud"
  std::string typeName;            // "N"; empty for a flag
  std::string defaultText;
  std::string help;
  std::string group;
  ValueWords values;
  bool isRepeated = false;

  bool TakesValue() const { return !typeName.empty(); }
};

struct PositionalModel {
  std::string name;
  std::string help;
  ValueWords values;
  bool isRequired = false;
  bool isRepeated = false;
};

struct CommandModel {
  std::string name;
  std::string summary;
  std::string group;   // of the list of commands
  std::string footer;  // lines, the example among them
  std::vector<OptionModel> options;
  std::vector<PositionalModel> positionals;
  std::vector<CommandModel> commands;  // below this one; none when it is run itself
};

// Hidden commands and options are left out. Main thread.
CommandModel ModelOf(const CLI::App& app);

// "/config/new" and its model for each command of a tree, the root with an empty path first.
struct PlacedCommand {
  std::string path;
  const CommandModel* command;
};

std::vector<PlacedCommand> AllCommands(const CommandModel& root);
