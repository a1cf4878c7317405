// SPDX-License-Identifier: Apache-2.0
#include "host/CommandLine.h"

#include <CLI/CLI.hpp>
#include <cstdio>
#include <exception>
#include <string>

#include "host/DemoCommand.h"
#include "host/DemoDevice.h"
#include "host/DemoSteps.h"
#include "host/ExitStatus.h"
#include "host/WatchCommand.h"
#include "host/commands/ConfigCommand.h"
#include "host/commands/ExplainCommand.h"

namespace {

constexpr const char* kVersion = "loka 1.0.0";
constexpr const char* kExitText =
    "Exit status: 0 done, 1 refused by the driver, 2 usage, 3 plug-in, 4 configuration,\n"
    "5 port, 128+n ended by signal n. Results go to stdout, everything else to stderr.";

// Everything that the commands take from the command line.
struct Arguments {
  ExplainOptions explain;
  ConfigOptions config;
  WatchOptions watch;
  std::string demoPlugin;
  std::string restartedPlugin;
  std::string restartedPort;
  std::string restartedStore;
};

void AddPlugin(CLI::App* command, std::string* file) {
  command->add_option("--plugin", *file, "Driver to load (else $LOKA_PLUGIN, else beside loka)")
      ->type_name("FILE");
}

void AddWatch(CLI::App* app, Arguments* arguments) {
  CLI::App* const watch = app->add_subcommand("watch", "Print each token that a device sends");
  WatchOptions& options = arguments->watch;
  watch
      ->add_option("--port", options.portWords,
                   "Port to open: a path, or comN=PATH for one of several names")
      ->type_name("PORT")
      ->required()
      ->expected(1)
      ->take_all();
  watch->add_option("--config", options.configuration, "Configuration, \"CfgVer=1 model=1 ...\"")
      ->type_name("TEXT")
      ->required();
  CLI::Option* const store =
      watch->add_option("--store", options.storeFile, "File with the stored settings")
          ->type_name("FILE");
  watch->add_flag("--no-store", options.withoutStore, "Neither use nor keep stored settings")
      ->excludes(store);
  watch->add_option("--ident", options.ident, "Whose stored settings (else the port name)")
      ->type_name("NAME");
  AddPlugin(watch, &options.pluginFile);
  watch->add_flag("-v,--verbose", options.isVerbose, "Say which files are used");
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

int Dispatch(const CLI::App& app, const Arguments& arguments) {
  if (app.got_subcommand("watch")) {
    return RunWatch(arguments.watch);
  }
  if (app.got_subcommand("explain")) {
    return RunExplain(arguments.explain);
  }
  if (app.got_subcommand("config")) {
    return RunConfig(arguments.config);
  }
  if (app.got_subcommand("demo")) {
    return RunDemo(arguments.demoPlugin);
  }
  if (app.got_subcommand("demo-device")) {
    return RunDemoDevice();
  }
  return RunDemoRestarted(arguments.restartedPlugin, arguments.restartedPort,
                          arguments.restartedStore);
}

}  // namespace

int RunCommandLine(int argumentCount, const char* const* arguments) {
  try {
    CLI::App app("Runs the serial token driver on ports of this machine.", "loka");
    app.set_version_flag("--version", kVersion);
    app.footer(kExitText);
    app.require_subcommand(0, 1);
    Arguments values;
    AddWatch(&app, &values);
    AddExplain(&app, &values.explain);
    AddConfig(&app, &values.config);
    AddDemo(&app, &values);
    try {
      app.parse(argumentCount, arguments);
    } catch (const CLI::ParseError& error) {
      return static_cast<int>(app.exit(error) == 0 ? ExitStatus::kDone : ExitStatus::kUsage);
    }
    if (app.get_subcommands().empty()) {
      (void)std::fprintf(stderr, "%s", app.help().c_str());
      return static_cast<int>(ExitStatus::kUsage);
    }
    return Dispatch(app, values);
  } catch (const std::exception& error) {
    (void)std::fprintf(stderr, "loka: %s\n", error.what());
    return static_cast<int>(ExitStatus::kRefused);
  }
}
