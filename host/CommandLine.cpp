// SPDX-License-Identifier: Apache-2.0
#include "host/CommandLine.h"

#include <CLI/CLI.hpp>
#include <algorithm>
#include <cstdio>
#include <exception>
#include <string>
#include <vector>

#include "host/CmdCommand.h"
#include "host/DemoCommand.h"
#include "host/DemoDevice.h"
#include "host/DemoSteps.h"
#include "host/DescribeCommand.h"
#include "host/ExitStatus.h"
#include "host/WatchCommand.h"
#include "host/commands/ConfigCommand.h"
#include "host/commands/ConnectCommand.h"
#include "host/commands/ExplainCommand.h"
#include "host/commands/PortsCommand.h"
#include "host/commands/ReadCommand.h"
#include "host/commands/RunCommand.h"
#include "host/commands/SendCommand.h"
#include "host/commands/SetCommand.h"
#include "host/commands/SimCommand.h"
#include "host/commands/StoreCommand.h"
#include "host/commands/SubCommand.h"
#include "host/commands/TagsCommand.h"
#include "host/commands/WriteCommand.h"
#include "host/sim/SimRun.h"

namespace {

constexpr const char* kVersion = "loka 1.0.0";
constexpr const char* kExitText =
    "Exit status: 0 done, 1 refused, 2 usage, 3 plug-in, 4 configuration, 5 port,\n"
    "6 line gone, 7 difference, 27 not in time, 128+n signal n. Results go to stdout.";

// Everything that the commands take from the command line.
struct Arguments {
  SubOptions sub;
  SendOptions send;
  AskOptions ask;
  RunOptions run;
  StatsOptions stats;
  TagsOptions tags;
  ReadOptions read;
  WriteOptions write;
  SetOptions set;
  StoreOptions store;
  ConnectOptions connect;
  ExplainOptions explain;
  ConfigOptions config;
  PortsOptions ports;
  InstanceOptions watch;
  CmdOptions cmd;
  std::string cmdPort;
  DescribeOptions describe;
  SimOptions sim;
  std::string demoPlugin;
  std::string restartedPlugin;
  std::string restartedPort;
  std::string restartedStore;
};

void AddPlugin(CLI::App* command, std::string* file) {
  command->add_option("--plugin", *file, "Driver to load (else $LOKA_PLUGIN, else beside loka)")
      ->type_name("FILE");
}

// The options of a command that runs a protocol instance.
void AddInstance(CLI::App* command, InstanceOptions* options, bool isRequired) {
  command
      ->add_option("--port", options->portWords,
                   "Port to open: a path, or comN=PATH for one of several names")
      ->type_name("PORT")
      ->required(isRequired)
      ->expected(1)
      ->take_all();
  command->add_option("--config", options->configuration, "Configuration, \"CfgVer=1 model=1 ...\"")
      ->type_name("TEXT")
      ->required(isRequired);
  CLI::Option* const store =
      command->add_option("--store", options->storeFile, "File with the stored settings")
          ->type_name("FILE");
  command->add_flag("--no-store", options->withoutStore, "Neither use nor keep stored settings")
      ->excludes(store);
  command->add_option("--ident", options->ident, "Whose stored settings (else the port name)")
      ->type_name("NAME");
  AddPlugin(command, &options->pluginFile);
  command->add_flag("-v,--verbose", options->isVerbose, "Say which files are used");
}

void AddWatch(CLI::App* app, Arguments* arguments) {
  CLI::App* const watch = app->add_subcommand("watch", "Print each token that a device sends");
  AddInstance(watch, &arguments->watch, true);
}

void AddCmd(CLI::App* app, Arguments* arguments) {
  CLI::App* const cmd = app->add_subcommand("cmd", "Run one console command of the driver");
  cmd->add_option("PORT", arguments->cmdPort, "Port to open, as --port says it")->type_name("");
  // For the help only: CutWords takes the words away before they are parsed.
  cmd->add_option("WORD", arguments->cmd.words, "The command; its words end the options")
      ->type_name("")
      ->expected(-1);
  AddInstance(cmd, &arguments->cmd.instance, false);
  cmd->add_option("--instance", arguments->cmd.instanceName, "Running instance, by its port")
      ->type_name("NAME");
  cmd->add_flag("--no-attach", arguments->cmd.isAttachRefused, "Never with a running instance");
  cmd->footer(std::string("Example: loka cmd /dev/ttyUSB0 --config \"$CONFIG\" put hello world\n") +
              kExitText);
}

// No command has a slash or a sign in its first word; a path and comN=PATH do.
bool LooksLikePort(const std::string& word) {
  const std::size_t mark = word.find_first_of(" /=");
  return mark != std::string::npos && word[mark] != ' ';
}

// Removes the words of a console command from the arguments of "cmd" and returns them: they start
// at the first argument that is no option, no option's value and no port, and end with the line, so
// that a word may look like an option.
std::vector<std::string> CutWords(const CLI::App& cmd, std::vector<std::string>* arguments) {
  bool hasPort = false;
  std::size_t at = 1;
  for (; at < arguments->size(); ++at) {
    const std::string& argument = (*arguments)[at];
    if (argument == "--") {
      break;
    }
    if (!argument.empty() && argument.front() == '-') {
      const CLI::Option* const option = cmd.get_option_no_throw(argument);
      if (option != nullptr && option->get_items_expected_max() > 0) {
        ++at;
      }
    } else if (!hasPort && LooksLikePort(argument)) {
      hasPort = true;
    } else {
      break;
    }
  }
  const auto first =
      arguments->begin() + static_cast<std::ptrdiff_t>(std::min(at, arguments->size()));
  std::vector<std::string> words(first, arguments->end());
  arguments->erase(first, arguments->end());
  if (!words.empty() && words.front() == "--") {
    words.erase(words.begin());
  }
  return words;
}

void Parse(CLI::App* app, std::vector<std::string> words, Arguments* values) {
  std::vector<std::string> commandWords;
  if (!words.empty() && words.front() == "cmd") {
    commandWords = CutWords(*app->get_subcommand("cmd"), &words);
  }
  // CLI11 takes a vector from its back.
  std::reverse(words.begin(), words.end());
  app->parse(words);
  values->cmd.words = std::move(commandWords);
  if (!values->cmdPort.empty()) {
    values->cmd.instance.portWords.push_back(values->cmdPort);
  }
}

void AddDescribe(CLI::App* app, Arguments* arguments) {
  CLI::App* const describe = app->add_subcommand(
      "describe", "Print what a driver says about its configuration and memory types");
  DescribeOptions& options = arguments->describe;
  CLI::Option* const file = describe
                                ->add_option("FILE", options.libraryFile,
                                             "Library to search, of any machine; it is not loaded")
                                ->type_name("");
  describe->add_option("--plugin", options.pluginFile, "Driver to load instead")
      ->type_name("FILE")
      ->excludes(file);
  CLI::Option* const xml =
      describe->add_flag("--xml", options.asXml, "The document as it stands, XML in UTF-8");
  describe->add_flag("--json", options.asJson, "The same as JSON")->excludes(xml);
}

void AddDemo(CLI::App* app, Arguments* arguments) {
  CLI::App* const demo =
      app->add_subcommand("demo", "Show and check the driver against a simulated device");
  AddPlugin(demo, &arguments->demoPlugin);
  // The two below are the demonstration's own other processes; an empty group hides them.
  app->add_subcommand("demo-device", "")->group("");
  CLI::App* const restarted = app->add_subcommand("demo-restarted", "")->group("");
  restarted->add_option("--plugin", arguments->restartedPlugin);
  restarted->add_option("--port", arguments->restartedPort)->required();
  restarted->add_option("--store", arguments->restartedStore)->required();
}

int Dispatch(const CLI::App& app, Arguments* arguments) {
  if (app.got_subcommand("sub")) {
    return RunSub(&arguments->sub);
  }
  if (app.got_subcommand("send")) {
    return RunSend(&arguments->send);
  }
  if (app.got_subcommand("ask")) {
    return RunAsk(&arguments->ask);
  }
  if (app.got_subcommand("run")) {
    return RunRun(&arguments->run);
  }
  if (app.got_subcommand("stats")) {
    return RunStats(&arguments->stats);
  }
  if (app.got_subcommand("tags")) {
    return RunTags(&arguments->tags);
  }
  if (app.got_subcommand("read")) {
    return RunRead(&arguments->read);
  }
  if (app.got_subcommand("write")) {
    return RunWrite(&arguments->write);
  }
  if (app.got_subcommand("set")) {
    return RunSet(&arguments->set);
  }
  if (app.got_subcommand("store")) {
    return RunStore(arguments->store);
  }
  if (app.got_subcommand("connect")) {
    return RunConnect(&arguments->connect);
  }
  if (app.got_subcommand("watch")) {
    return RunWatch(arguments->watch);
  }
  if (app.got_subcommand("cmd")) {
    return RunCmd(arguments->cmd);
  }
  if (app.got_subcommand("describe")) {
    return RunDescribe(arguments->describe);
  }
  if (app.got_subcommand("sim")) {
    return RunSim(arguments->sim);
  }
  if (app.got_subcommand("explain")) {
    return RunExplain(arguments->explain);
  }
  if (app.got_subcommand("config")) {
    return RunConfig(arguments->config);
  }
  if (app.got_subcommand("ports")) {
    return RunPorts(arguments->ports);
  }
  if (app.got_subcommand("demo")) {
    return RunDemo(arguments->demoPlugin);
  }
  if (app.got_subcommand("demo-device")) {
    return RunDemoDevice();
  }
  return RunDemoRestarted(arguments->restartedPlugin, arguments->restartedPort,
                          arguments->restartedStore);
}

}  // namespace

int RunCommandLine(int argumentCount, const char* const* arguments) {
  try {
    CLI::App app("Runs the serial token driver on ports of this machine.", "loka");
    app.set_version_flag("--version", kVersion);
    app.footer(kExitText);
    app.require_subcommand(0, 1);
    Arguments values;
    AddSub(&app, &values.sub);
    AddSend(&app, &values.send);
    AddAsk(&app, &values.ask);
    AddRun(&app, &values.run);
    AddStats(&app, &values.stats);
    AddTags(&app, &values.tags);
    AddRead(&app, &values.read);
    AddWrite(&app, &values.write);
    AddSet(&app, &values.set);
    AddStore(&app, &values.store);
    AddConnect(&app, &values.connect);
    AddWatch(&app, &values);
    AddCmd(&app, &values);
    AddDescribe(&app, &values);
    AddSim(&app, &values.sim);
    AddExplain(&app, &values.explain);
    AddConfig(&app, &values.config);
    AddPorts(&app, &values.ports);
    AddDemo(&app, &values);
    try {
      Parse(&app, {arguments + std::min(argumentCount, 1), arguments + argumentCount}, &values);
    } catch (const CLI::ParseError& error) {
      return static_cast<int>(app.exit(error) == 0 ? ExitStatus::kDone : ExitStatus::kUsage);
    }
    if (app.get_subcommands().empty()) {
      (void)std::fprintf(stderr, "%s", app.help().c_str());
      return static_cast<int>(ExitStatus::kUsage);
    }
    return Dispatch(app, &values);
  } catch (const std::exception& error) {
    (void)std::fprintf(stderr, "loka: %s\n", error.what());
    return static_cast<int>(ExitStatus::kRefused);
  }
}
