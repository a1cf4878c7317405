// SPDX-License-Identifier: Apache-2.0
#include "host/commands/SetCommand.h"

#include <CLI/CLI.hpp>
#include <algorithm>

#include "host/commands/SettingText.h"
#include "host/commands/SettingWord.h"
#include "host/control/AttachedInstance.h"
#include "host/events/JsonLine.h"
#include "host/instance/TrapHints.h"
#include "host/text/ByteText.h"
#include "host/text/Output.h"
#include "host/text/Utf8Text.h"

namespace {

using Json = nlohmann::json;

std::vector<std::string> KeysOf(const std::vector<SettingWord>& settings) {
  std::vector<std::string> keys;
  keys.reserve(settings.size());
  for (const SettingWord& setting : settings) {
    keys.emplace_back(setting.entry->key);
  }
  return keys;
}

// All words, before the first of them is staged.
bool ParseWords(const std::vector<std::string>& words, std::vector<SettingWord>* settings,
                std::string* error) {
  for (const std::string& word : words) {
    SettingWord setting;
    if (!ParseSettingWord(word, &setting, error)) {
      return false;
    }
    const std::vector<std::string> former = KeysOf(*settings);
    if (std::find(former.begin(), former.end(), setting.entry->key) != former.end()) {
      *error = std::string(setting.entry->key) + " is given twice";
      return false;
    }
    settings->push_back(std::move(setting));
  }
  return true;
}

// One JSON object a line, or the text.
bool Print(const SetOptions& options, const Json& data, const std::string& text) {
  return WriteResult((options.isJson ? JsonLine(data) : text) + "\n");
}

Answer Stage(Instance* instance, const SetOptions& options,
             const std::vector<SettingWord>& settings) {
  Answer answer;
  SettingRows staged;
  for (const SettingWord& setting : settings) {
    answer =
        instance->Call({{"op", "stage"}, {"key", setting.entry->key}, {"value", setting.tagValue}});
    if (!answer.IsDone()) {
      break;
    }
    staged.push_back(answer.data);
  }
  if (!staged.empty() && !Print(options, {{"staged", staged}}, StagedText(staged))) {
    answer.status = ExitStatus::kRefused;
  }
  return answer;
}

Answer Apply(Instance* instance, const SetOptions& options,
             const std::vector<SettingWord>& settings) {
  Answer answer = instance->Call({{"op", "done"}});
  if (!answer.IsDone()) {
    return answer;
  }
  if (!options.isJson) {
    DropClearedHint(&answer);
  }
  const std::string others = AlsoAppliedText(answer.data, KeysOf(settings));
  if (!others.empty()) {
    answer.hints.push_back("staged before and applied as well: " + others);
  }
  if (!Print(options, answer.data, AppliedText(answer.data))) {
    answer.status = ExitStatus::kRefused;
  }
  return answer;
}

Answer Show(Instance* instance, const SetOptions& options) {
  Answer answer = instance->Call({{"op", "settings"}});
  if (!answer.IsDone()) {
    return answer;
  }
  const SettingRows rows = answer.data.value("rows", SettingRows());
  std::string lines;
  for (const Json& row : rows) {
    lines += JsonLine(row) + "\n";
  }
  AddConsoleHints(rows, &answer.hints);
  if (!WriteResult(options.isJson ? lines : SettingsTable(rows))) {
    answer.status = ExitStatus::kRefused;
  }
  return answer;
}

int SetUsage(const std::string& text) {
  TellUser(PrintableUtf8(text));
  return static_cast<int>(ExitStatus::kUsage);
}

}  // namespace

void AddSet(CLI::App* app, SetOptions* options) {
  CLI::App* const set = app->add_subcommand("set", "Change settings at run time, or show them");
  CLI::Option* const words =
      set->add_option("KEY=VALUE", options->words, "Settings to stage and apply")->type_name("");
  set->add_flag("--stage", options->isStageOnly, "Stage only; SP_Done or a later set applies")
      ->needs(words);
  set->add_flag("--show", options->isShown, "Show configured, active, staged and stored values")
      ->excludes(words);
  set->add_flag("-j,--json", options->isJson, "One JSON object a line");
  AddInstanceAccess(set, &options->access, false);
  set->footer("Keys: " + SettingNames() + "\nExample: loka set rx_suffix=CRLF baud=19200");
}

int RunSet(SetOptions* options) {
  std::vector<SettingWord> settings;
  std::string error;
  if (!ParseWords(options->words, &settings, &error)) {
    return SetUsage(error);
  }
  options->access.acknowledges = false;
  options->access.connects = false;
  Answer answer;
  const auto instance = OpenInstance(&options->access, &answer);
  if (instance == nullptr) {
    return TellAnswer(answer);
  }
  if (settings.empty()) {
    return EndOf(*instance, Show(instance.get(), *options));
  }
  answer = Stage(instance.get(), *options, settings);
  if (answer.IsDone() && !options->isStageOnly) {
    answer = Apply(instance.get(), *options, settings);
  } else if (answer.IsDone() && dynamic_cast<AttachedInstance*>(instance.get()) == nullptr) {
    answer.hints.emplace_back(
        "no instance is running: what is staged here goes with this command; start loka run first");
  }
  return EndOf(*instance, answer);
}
