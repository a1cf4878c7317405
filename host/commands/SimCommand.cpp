// SPDX-License-Identifier: Apache-2.0
#include "host/commands/SimCommand.h"

#include <CLI/CLI.hpp>
#include <string>

#include "host/framing/ControlNames.h"
#include "host/sim/DeviceCatalogue.h"
#include "host/sim/SimWords.h"

namespace {

constexpr int kMs = 1;
constexpr int kSecondMs = 1000;
constexpr int kMostBurst = 10000;
constexpr int kMostBaud = 4000000;

// An option whose word is read by `read`, which says false when the word is not right.
template <typename Read>
CLI::Option* AddWord(CLI::App* command, const std::string& name, const std::string& type,
                     const std::string& help, Read read) {
  return command
      ->add_option_function<std::string>(
          name,
          [name, type, read](const std::string& word) {
            if (!read(word)) {
              throw CLI::ValidationError(name, word + " is no " + type);
            }
          },
          help)
      ->type_name(type);
}

CLI::Option* AddTime(CLI::App* command, const std::string& name, int unitMs,
                     const std::string& help, int* timeMs) {
  return AddWord(command, name, unitMs == kMs ? "MS" : "S", help,
                 [=](const std::string& word) { return ParseTimeMs(word, unitMs, timeMs); });
}

void AddPercent(CLI::App* command, const std::string& name, const std::string& help,
                double* percent) {
  AddWord(command, name, "PERCENT", help,
          [=](const std::string& word) { return ParsePercent(word, percent); });
}

void AddBytes(CLI::App* command, const std::string& name, const std::string& help,
              std::optional<std::string>* bytes) {
  command
      ->add_option_function<std::string>(
          name,
          [=](const std::string& word) {
            std::string parsed;
            std::string error;
            if (!ParseControlText(word, &parsed, &error)) {
              throw CLI::ValidationError(name, error);
            }
            *bytes = parsed;
          },
          help)
      ->type_name("HEX");
}

void AddRunOptions(CLI::App* command, SimOptions* options) {
  command->add_option("--link", options->linkPath, "Symbolic link to the port")->type_name("PATH");
  AddWord(command, "--every", "MS", "Interval, 250ms or 2s; 0: speak only when asked",
          [=](const std::string& word) {
            int timeMs = 0;
            const bool isTime = ParseTimeMs(word, kMs, &timeMs);
            options->everyMs = timeMs;
            return isTime;
          });
  command->add_option("--burst", options->burst, "Messages at each interval")
      ->type_name("N")
      ->check(CLI::Range(1, kMostBurst).description(""));
  command->add_option("--count", options->count, "End after so many messages")
      ->type_name("N")
      ->check(CLI::PositiveNumber.description(""));
  AddTime(command, "--for", kSecondMs, "End after this time", &options->forMs);
  command->add_option("--seed", options->device.seed, "Repeats a run: faults and values")
      ->type_name("N");
  command->add_flag("-j,--json", options->isJson, "One JSON object a line: all that was sent");
}

void AddContentOptions(CLI::App* command, SimOptions* options) {
  AddBytes(command, "--prefix", "In front of each message: 02, STX, none", &options->prefix);
  AddBytes(command, "--suffix", "Behind each message: 0D0A, CRLF, none", &options->suffix);
  command
      ->add_option_function<std::vector<std::string>>(
          "--text",
          [=](const std::vector<std::string>& words) {
            for (const std::string& word : words) {
              std::string text;
              if (!ParseEscapedText(word, &text)) {
                throw CLI::ValidationError("--text", word + " has a wrong escape");
              }
              options->device.texts.push_back(text);
            }
          },
          "Sent instead, \\x1D for bytes; several in turn")
      ->type_name("TEXT")
      ->expected(1)
      ->take_all();
}

void AddFaultOptions(CLI::App* command, SimOptions* options) {
  FaultOptions* const faults = &options->faults;
  AddPercent(command, "--drop-prefix", "Messages without their prefix", &faults->dropPrefixPercent);
  AddPercent(command, "--drop-suffix", "Messages without their suffix", &faults->dropSuffixPercent);
  AddPercent(command, "--noise", "Bytes with a random one in front", &faults->noisePercent);
  AddPercent(command, "--flip", "Bytes with one wrong bit", &faults->flipPercent);
  AddWord(command, "--split", "N|MS", "In pieces: 3, 50ms or 3@50ms",
          [=](const std::string& word) { return ParseSplit(word, faults); });
  AddWord(command, "--too-long", "BYTES", "Bodies that long: 1200, or 1200@5% for some",
          [=](const std::string& word) { return ParseTooLong(word, faults); });
  command->add_option("--baud", faults->baud, "Send at the pace of a line, ten bits a byte")
      ->type_name("RATE")
      ->check(CLI::Range(1, kMostBaud).description(""));
  AddTime(command, "--unplug-every", kSecondMs, "Pull the plug that often (with --link)",
          &options->unplugEveryMs);
  AddTime(command, "--unplug-for", kSecondMs, "Leave it pulled for so long (2)",
          &options->unplugForMs);
}

// Without a link nobody would find the port again.
void CheckUnplug(const SimOptions& options) {
  if (options.unplugEveryMs > 0 && options.linkPath.empty()) {
    throw CLI::ValidationError("--unplug-every", "needs --link");
  }
  if (options.unplugEveryMs > 0 && options.unplugForMs >= options.unplugEveryMs) {
    throw CLI::ValidationError("--unplug-for", "must be shorter than --unplug-every");
  }
}

std::string Footer(const DeviceKind& kind) {
  DeviceSettings settings;
  settings.framing = kind.framing;
  return std::string(kind.description) +
         "\nPERCENT: 5, 5% or 0.5%. The first line on stdout is the path of the port.\n"
         "Receive it: loka config new " +
         ConfigArgumentsFor(kind, settings) + "\nExample:    loka sim " + kind.name +
         " --link /tmp/" + kind.name + " --drop-suffix 5% -j";
}

void AddDevice(CLI::App* sim, const DeviceKind& kind, SimOptions* options) {
  CLI::App* const command = sim->add_subcommand(kind.name, kind.summary);
  AddRunOptions(command, options);
  AddContentOptions(command, options);
  const std::string name = kind.name;
  if (name == "scale") {
    command->add_option("--drift", options->device.driftGrams, "Weight moves up to so much")
        ->type_name("GRAMS")
        ->check(CLI::Range(0, 100000).description(""));
  } else if (name == "rfid") {
    command->add_flag("--binary", options->device.isBinary, "Send the bytes, not digits");
  }
  AddFaultOptions(command, options);
  command->footer(Footer(kind));
  command->callback([options, name] {
    options->kind = name;
    CheckUnplug(*options);
  });
}

}  // namespace

void AddSim(CLI::App* app, SimOptions* options) {
  CLI::App* const sim =
      app->add_subcommand("sim", "A simulated device on a pseudo-terminal, with faults");
  sim->require_subcommand(1);
  for (const DeviceKind& kind : DeviceKinds()) {
    AddDevice(sim, kind, options);
  }
  sim->footer("Example: loka sim barcode --link /tmp/scanner --every 2s --drop-suffix 5%");
}
