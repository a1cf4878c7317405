// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <memory>
#include <string>
#include <vector>

namespace CLI {
class App;
}

// One command of the program: what the command line knows of it, and what runs it.
class Command {
 public:
  Command() = default;
  virtual ~Command() = default;

  Command(const Command&) = delete;
  Command& operator=(const Command&) = delete;

  // Adds exactly one subcommand, whose options refer to this object.
  virtual void AddTo(CLI::App* app) = 0;

  // Takes what is not for the parser out of the words behind the command's name.
  virtual void Prepare(const CLI::App& /*command*/, std::vector<std::string>* /*words*/) {}

  // Returns the exit status of the program.
  virtual int Run() = 0;
};

// All commands with their options: what --help, the manual pages and the completion files tell, and
// what a command line is parsed with. Main thread.
class CommandTree {
 public:
  CommandTree();
  ~CommandTree();

  CommandTree(const CommandTree&) = delete;
  CommandTree& operator=(const CommandTree&) = delete;

  // The words behind the program's name. False when the program is to end with `status`: after
  // --help and after wrong usage, which is told on standard error.
  bool Parse(std::vector<std::string> words, int* status);

  // Runs the command that was parsed. Returns the exit status of the program.
  int Run();

  const CLI::App& App() const { return *app_; }

 private:
  struct Entry {
    CLI::App* app;
    std::unique_ptr<Command> command;
  };

  // The group is a heading in the list of commands; an empty one hides the command.
  void Add(const char* group, std::unique_ptr<Command> command);
  Entry* Find(const std::string& name);

  std::unique_ptr<CLI::App> app_;
  std::vector<Entry> entries_;
};
