// SPDX-License-Identifier: Apache-2.0
#include "host/commands/SubCommand.h"

#include <CLI/CLI.hpp>
#include <limits>

#include "host/commands/EventPrinter.h"
#include "host/events/SinkPair.h"
#include "host/log/LogFile.h"
#include "host/text/Output.h"

namespace {

constexpr int kForeverMs = std::numeric_limits<int>::max();
constexpr double kMaxLimitSeconds = 2000000;

bool MakePrintOptions(const SubOptions& options, PrintOptions* print, std::string* error) {
  using Form = PrintOptions::Form;
  print->hasTime = options.hasTime;
  print->isRaw = options.isRaw;
  print->isQuiet = options.access.isQuiet;
  print->verbosity = options.access.verbosity;
  print->colour = options.access.colour;
  if (options.isJson) {
    print->form = Form::kJson;
  } else if (options.isDump) {
    print->form = Form::kDump;
  } else if (options.isHex) {
    print->form = Form::kHex;
  } else if (!options.format.empty()) {
    print->form = Form::kFormat;
    return TokenFormat::Parse(options.format, &print->format, error);
  }
  return true;
}

}  // namespace

void AddSub(CLI::App* app, SubOptions* options) {
  CLI::App* const sub = app->add_subcommand("sub", "Print tokens as they come, acknowledge them");
  sub->add_option("-C,--count", options->count, "End after N tokens")
      ->type_name("N")
      ->check(
          CLI::Range(std::uint64_t{1}, std::numeric_limits<std::uint64_t>::max()).description(""));
  sub->add_option("-W,--wait", options->limitSeconds,
                  "End after S seconds: status 27 without the tokens of -C")
      ->type_name("S")
      ->check(CLI::Range(0.001, kMaxLimitSeconds).description(""));
  CLI::Option* const format =
      sub->add_option("-F,--format", options->format,
                      "Line of a token: %t time %n number %l length %p payload %x hex %a waiting "
                      "%P port %j JSON %%")
          ->type_name("FORMAT");
  CLI::Option* const json = sub->add_flag("-j,--json", options->isJson, "One JSON object a line");
  CLI::Option* const hex =
      sub->add_flag("-x,--hex-output", options->isHex, "Tokens as hexadecimal");
  sub->add_flag("-X,--dump", options->isDump, "Frames as hexadecimal and characters")
      ->excludes(json)
      ->excludes(format)
      ->excludes(hex);
  json->excludes(format)->excludes(hex);
  hex->excludes(format);
  sub->add_flag("-t,--time", options->hasTime, "Time of day in front of each line")->excludes(json);
  sub->add_flag("--raw", options->isRaw, "Bytes as they come instead of tokens")->excludes(format);
  sub->add_flag("--peek", options->isPeek, "Leave tokens in the queue: print the oldest only");
  sub->add_option("-L,--log", options->logFile, "Append every event to a file")->type_name("FILE");
  AddInstanceAccess(sub, &options->access);
  sub->footer(
      "Example: loka sub /dev/ttyUSB0 -b 9600 -p none --rx-prefix STX --rx-suffix ETX -C 3");
}

int RunSub(SubOptions* options) {
  PrintOptions print;
  std::string error;
  if (!MakePrintOptions(*options, &print, &error)) {
    TellUser("--format: " + error);
    return static_cast<int>(ExitStatus::kUsage);
  }
  const auto log = OpenLog(options->logFile, &error);
  if (!error.empty()) {
    TellUser(error);
    return static_cast<int>(ExitStatus::kRefused);
  }
  options->access.acknowledges = !options->isPeek;
  options->access.watches = true;
  Answer answer;
  const auto instance = OpenInstance(&options->access, &answer);
  if (instance == nullptr) {
    return TellAnswer(answer);
  }
  EventPrinter printer(print);
  const auto isDone = [&] {
    return printer.IsOutputGone() || (options->count > 0 && printer.TokenCount() >= options->count);
  };
  const Deadline deadline = options->limitSeconds > 0
                                ? Deadline::After(static_cast<int>(options->limitSeconds * 1000))
                                : Deadline::After(kForeverMs);
  SinkPair sinks(&printer, log.get());
  answer = instance->Serve(&sinks, isDone, deadline);
  // Without a count the time limit is the way to end.
  if (answer.status == ExitStatus::kTimeout && options->count == 0) {
    answer = Answer();
  }
  return EndOf(*instance, answer);
}
