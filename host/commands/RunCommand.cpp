// SPDX-License-Identifier: Apache-2.0
#include "host/commands/RunCommand.h"

#include <unistd.h>

#include <CLI/CLI.hpp>
#include <limits>

#include "host/commands/StatsText.h"
#include "host/control/ControlPath.h"
#include "host/events/EventSink.h"
#include "host/events/EventText.h"
#include "host/events/JsonLine.h"
#include "host/events/SinkPair.h"
#include "host/events/WallClock.h"
#include "host/instance/LocalInstance.h"
#include "host/log/LogFile.h"
#include "host/text/BackgroundLines.h"
#include "host/text/Output.h"

namespace {

constexpr int kForeverMs = std::numeric_limits<int>::max();

// Writes what happens to standard error, one line with the time each, as a service's journal wants
// it. A journal that does not read must not stop the instance.
class LogPrinter final : public EventSink {
 public:
  LogPrinter(int verbosity, bool isQuiet) : verbosity_(verbosity), isQuiet_(isQuiet) {}

  void OnEvent(const HostEvent& event) override {
    const bool isTraffic = std::holds_alternative<BytesReceived>(event.detail) ||
                           std::holds_alternative<BytesSent>(event.detail) ||
                           std::holds_alternative<BytesLabelled>(event.detail);
    const bool isToken = std::holds_alternative<TokenReceived>(event.detail);
    if (isQuiet_ || (isTraffic && verbosity_ < 2) || (isToken && verbosity_ < 1)) {
      return;
    }
    lines_.Write("loka: " + LocalTimeText(event.timeUs) + " " + EventText(event));
  }

 private:
  BackgroundLines lines_{STDERR_FILENO};
  const int verbosity_;
  const bool isQuiet_;
};

}  // namespace

void AddRun(CLI::App* app, RunOptions* options) {
  CLI::App* const run = app->add_subcommand("run", "Own a port and stay, for others to attach");
  run->add_option("--ack", options->acknowledge,
                  "auto: take each token, publish and acknowledge it; never: leave that to others")
      ->check(CLI::IsMember({"auto", "never"}).description(""))
      ->type_name("auto|never")
      ->capture_default_str();
  run->add_option("-L,--log", options->logFile, "Append every event to a file")->type_name("FILE");
  AddInstanceAccess(run, &options->access);
  run->footer("Example: loka run --config scale.cfg /dev/ttyUSB0 --ack never");
}

int RunRun(RunOptions* options) {
  options->access.acknowledges = options->acknowledge == "auto";
  Answer answer;
  if (!Resolve(&options->access, &answer)) {
    return TellAnswer(answer);
  }
  std::string error;
  const auto log = OpenLog(options->logFile, &error);
  if (!error.empty()) {
    TellUser(error);
    return static_cast<int>(ExitStatus::kRefused);
  }
  const auto instance = BeginInstance(options->access, &answer);
  if (instance == nullptr) {
    return TellAnswer(answer);
  }
  if (!instance->Share(&error)) {
    TellUser(error);
    return static_cast<int>(ExitStatus::kPort);
  }
  if (!options->access.isQuiet) {
    TellUser("tokens are " + std::string(options->access.acknowledges
                                             ? "taken, published and acknowledged (--ack auto)"
                                             : "left to those who attach (--ack never)"));
    TellUser("ready; commands attach at " + ControlPath(instance->Port()));
  }
  {
    LogPrinter printer(options->access.verbosity, options->access.isQuiet);
    SinkPair sinks(&printer, log.get());
    answer = instance->Serve(
        &sinks, [] { return false; }, Deadline::After(kForeverMs));
  }
  return EndOf(*instance, answer);
}

void AddStats(CLI::App* app, StatsOptions* options) {
  CLI::App* const stats = app->add_subcommand("stats", "Show the counters of a running instance");
  stats->add_flag("-j,--json", options->isJson, "As one JSON object");
  stats->add_option("--instance", options->access.instanceName, "Which one, by its port")
      ->type_name("NAME");
  stats->footer("Example: loka stats -j");
}

int RunStats(StatsOptions* options) {
  options->access.isAttachWanted = true;
  Answer answer;
  const auto instance = OpenInstance(&options->access, &answer);
  if (instance == nullptr) {
    return TellAnswer(answer);
  }
  answer = instance->Call({{"op", "stats"}});
  if (!answer.IsDone()) {
    return TellAnswer(answer);
  }
  if (options->isJson) {
    (void)WriteResult(JsonLine(answer.data) + "\n");
  } else {
    (void)WriteResult(StatsText(answer.data) + "\n");
  }
  return 0;
}
