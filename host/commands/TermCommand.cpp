// SPDX-License-Identifier: Apache-2.0
#include "host/commands/TermCommand.h"

#include <unistd.h>

#include <CLI/CLI.hpp>
#include <cstdlib>
#include <memory>

#include "host/commands/TermSession.h"
#include "host/control/AttachedInstance.h"
#include "host/control/ControlPath.h"
#include "host/instance/LocalInstance.h"
#include "host/term/HistoryPath.h"
#include "host/term/LineEditor.h"
#include "host/term/TermKeys.h"
#include "host/text/Output.h"

namespace {

constexpr double kMaxLingerSeconds = 2000000;

// The terminal to draw the line that is typed on; -1 when lines are read as they come.
int ScreenDescriptor() {
  const char* const kind = std::getenv("TERM");
  if (isatty(STDIN_FILENO) == 0 || kind == nullptr || std::string(kind) == "dumb") {
    return -1;
  }
  for (const int descriptor : {STDOUT_FILENO, STDERR_FILENO}) {
    if (isatty(descriptor) != 0) {
      return descriptor;
    }
  }
  return -1;
}

TermSession::Settings SettingsOf(const TermOptions& options) {
  TermSession::Settings settings;
  (void)ParseMode(options.inputMode, &settings.inputMode);
  (void)ParseMode(options.outputMode, &settings.outputMode);
  settings.logFile = options.logFile;
  settings.hasTime = options.hasTime;
  settings.isQuiet = options.access.isQuiet;
  settings.verbosity = options.access.verbosity;
  settings.colour = options.access.colour;
  settings.lingerMs = static_cast<int>(options.lingerSeconds * 1000);
  return settings;
}

// Lets others attach. A second instance of the same port name cannot, and goes on alone.
void Share(LocalInstance* instance, const InstanceAccess& access) {
  std::string error;
  const bool isShared = instance->Share(&error);
  if (!isShared) {
    TellUser("nobody can attach: " + error);
  }
  if (access.isQuiet) {
    return;
  }
  TellUser("tokens are " + std::string(access.acknowledges
                                           ? "shown and acknowledged (--ack auto)"
                                           : "left in the queue: ctrl-t a acknowledges "
                                             "(--ack never)"));
  if (isShared) {
    TellUser("commands attach at " + ControlPath(instance->Port()));
  }
}

// A running instance, else one of its own that others can attach to. `local` tells the two apart.
std::unique_ptr<Instance> OpenForTerm(InstanceAccess* access, LocalInstance** local,
                                      Answer* answer) {
  access->watches = true;
  auto instance = OpenInstance(access, answer);
  *local = dynamic_cast<LocalInstance*>(instance.get());
  if (*local != nullptr) {
    Share(*local, *access);
  }
  return instance;
}

}  // namespace

void AddTerm(CLI::App* app, TermOptions* options) {
  CLI::App* const term = app->add_subcommand("term", "Type lines, see tokens: a terminal");
  term->add_option("--ack", options->acknowledge,
                   "auto: acknowledge each token that is shown; never: leave it in the queue")
      ->check(CLI::IsMember({"auto", "never"}).description(""))
      ->type_name("auto|never")
      ->capture_default_str();
  term->add_option("--input", options->inputMode,
                   "What a line is: text with \\x02 and the like, hex, a console command")
      ->check(CLI::IsMember({"text", "hex", "console"}).description(""))
      ->type_name("text|hex|console")
      ->capture_default_str();
  term->add_option(
          "--output", options->outputMode,
          "Tokens as text or hex, frames as dump; raw: not escaped, may steer the terminal")
      ->check(CLI::IsMember({"text", "hex", "dump", "raw"}).description(""))
      ->type_name("text|hex|dump|raw")
      ->capture_default_str();
  term->add_flag("-t,--time", options->hasTime, "Time of day in front of each token");
  term->add_option("-L,--log", options->logFile, "Append every event to a file")->type_name("FILE");
  term->add_option("-W,--wait", options->lingerSeconds,
                   "Seconds to stay for answers behind the end of an input that is no terminal")
      ->type_name("S")
      ->check(CLI::Range(0.0, kMaxLingerSeconds).description(""))
      ->capture_default_str();
  AddInstanceAccess(term, &options->access);
  term->footer("Keys:\n" + TermKeyList() +
               "Example: loka term /dev/ttyUSB0 -b 9600 -p none --rx-suffix CRLF --tx-suffix CRLF");
}

int RunTerm(TermOptions* options) {
  const int screen = ScreenDescriptor();
  if (screen >= 0 && !LineEditor::IsBuiltIn()) {
    TellUser("built without the terminal (LOKA_WITH_TERM); lines from a pipe work");
    return static_cast<int>(ExitStatus::kRefused);
  }
  options->access.acknowledges = options->acknowledge == "auto";
  Answer answer;
  LocalInstance* local = nullptr;
  const auto instance = OpenForTerm(&options->access, &local, &answer);
  if (instance == nullptr) {
    return TellAnswer(answer);
  }
  std::unique_ptr<LineEditor> editor;
  std::string error;
  if (screen >= 0) {
    editor = LineEditor::Make(STDIN_FILENO, screen, HistoryPath(), &error);
    if (editor == nullptr) {
      TellUser(error + "; lines are read as they come");
    }
  }
  TermSession session(instance.get(), local == nullptr ? nullptr : local->Events(), editor.get(),
                      SettingsOf(*options));
  answer = session.Run();
  editor.reset();
  return EndOf(*instance, answer);
}
