// SPDX-License-Identifier: Apache-2.0
#include "host/commands/ExplainCommand.h"

#include <CLI/CLI.hpp>
#include <cstdio>

#include "host/base/ExitStatus.h"
#include "host/commands/CommandFailure.h"
#include "host/commands/InstanceAccess.h"
#include "host/framing/ConfigEdit.h"
#include "host/framing/ConfigReport.h"
#include "host/framing/DriverReplay.h"
#include "host/framing/ExplainReport.h"
#include "host/framing/LineScript.h"
#include "host/text/ByteText.h"
#include "host/text/Output.h"

namespace {

// The line is silent behind the end of the input. Silences that follow each other add up.
void Play(const LineScript& script, int gapMs, ByteLabeller* labeller) {
  long long silentMs = 0;
  for (const LineEvent& event : script) {
    if (!event.bytes.empty()) {
      silentMs = 0;
      labeller->OnBytes(event.bytes);
      continue;
    }
    silentMs += event.silenceMs == 0 ? gapMs : event.silenceMs;
    if (silentMs >= gapMs) {
      labeller->OnSilence(gapMs);
      silentMs -= gapMs;
    }
  }
  labeller->OnSilence(gapMs);
}

void TellHints(const ExplainReport& report, const FramingSettings& settings) {
  for (const DropReason reason : report.Reasons()) {
    TellUser(std::string(NameOf(reason)) + ": " + HintFor(reason));
  }
  if (report.HasZeroByte() && !settings.isHex) {
    TellUser("a token holds a zero byte: tags show it up to there; --hex shows all of it");
  }
  TellUser("tokens " + std::to_string(report.Tokens().size()) + "  dropped " +
           std::to_string(report.DroppedBytes()) + " bytes");
}

std::string Shown(const std::vector<std::string>& tokens, std::size_t index) {
  return index < tokens.size() ? "\"" + EscapeBytes(tokens[index]) + "\"" : "nothing";
}

// Compares with the driver; the first difference says enough.
int Check(const ExplainOptions& options, const std::string& configuration, const LineScript& script,
          const std::vector<std::string>& expected) {
  const ReplayResult replay = ReplayThroughDriver(options.pluginFile, configuration, script);
  if (!replay.IsDone()) {
    return Fail(replay.status, replay.text);
  }
  const std::size_t count = std::max(expected.size(), replay.tokens.size());
  for (std::size_t i = 0; i < count; ++i) {
    if (i >= expected.size() || i >= replay.tokens.size() || expected[i] != replay.tokens[i]) {
      TellUser("finding: token " + std::to_string(i + 1) + " of the driver is " +
               Shown(replay.tokens, i) + ", expected " + Shown(expected, i));
      return static_cast<int>(ExitStatus::kDifference);
    }
  }
  TellUser("checked: " + replay.pluginPath + " cuts the same " + std::to_string(count) + " tokens");
  return static_cast<int>(ExitStatus::kDone);
}

bool MakeConfiguration(const ExplainOptions& options, std::string* configuration,
                       std::string* error) {
  if (options.configurationWord.empty()) {
    *configuration = options.framing.Configuration();
    return true;
  }
  if (!ReadConfiguration(options.configurationWord, configuration, error)) {
    return false;
  }
  *configuration = options.framing.Apply(*configuration);
  return true;
}

}  // namespace

void AddExplain(CLI::App* app, ExplainOptions* options) {
  CLI::App* const explain =
      app->add_subcommand("explain", "Say what framing makes of bytes; needs no port");
  explain
      ->add_option("INPUT", options->input,
                   "Bytes (02, STX, CRLF), ~ or ~500 for a silence, a FILE, or -")
      ->type_name("")
      ->required();
  options->framing.AddReceiving(explain);
  explain->add_option("--config", options->configurationWord, "Configuration: text, FILE or -")
      ->type_name("CONFIG");
  explain->add_flag("--words", options->hasWords, "FILE holds words as above, # comments");
  explain->add_flag("-j,--json", options->isJson, "One JSON object a line");
  AddColour(explain, &options->colour);
  explain->add_flag("--check", options->isChecked,
                    "Compare with the driver: status 7 if it differs");
  explain->add_option("--plugin", options->pluginFile, "Driver for --check")->type_name("FILE");
  explain->footer("Example: loka explain --rx-prefix 0202 --rx-suffix 03 02 05 02 02 41 03");
}

int RunExplain(const ExplainOptions& options) {
  (void)std::setvbuf(stdout, nullptr, _IOLBF, BUFSIZ);
  if (options.configurationWord == "-" && options.input.front() == "-") {
    return Fail(ExitStatus::kUsage, "only one of --config and the input can be standard input");
  }
  std::string configuration;
  LineScript script;
  std::string error;
  if (!MakeConfiguration(options, &configuration, &error) ||
      !ReadLineScript(options.input, options.hasWords, &script, &error)) {
    return Fail(ExitStatus::kUsage, error);
  }
  const FramingSettings settings = FramingOfConfiguration(configuration);
  TellUser(ReceivingText(settings));
  ExplainReport report(options.isJson, TextStyle(options.colour),
                       [](const std::string& line) { (void)std::printf("%s\n", line.c_str()); });
  ByteLabeller labeller(settings, &report);
  // A port counts a wait of less than 1 ms as 1 ms.
  Play(script, std::max(settings.SilenceMs(), 1), &labeller);
  report.Finish();
  TellHints(report, settings);
  if (options.isChecked) {
    return Check(options, configuration, script, report.Tokens());
  }
  return static_cast<int>(ExitStatus::kDone);
}
