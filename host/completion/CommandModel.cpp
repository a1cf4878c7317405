// SPDX-License-Identifier: Apache-2.0
#include "host/completion/CommandModel.h"

#include <CLI/CLI.hpp>
#include <algorithm>
#include <array>
#include <map>
#include <string_view>

#include "host/framing/ConfigKeyTable.h"
#include "host/instance/SettingTable.h"

namespace {

using Kind = ValueWords::Kind;

// Names that people use most; ParseControlText takes any byte.
constexpr std::array<const char*, 10> kControlWords = {"STX", "ETX", "CR",  "LF",  "CRLF",
                                                       "EOT", "ENQ", "ACK", "NUL", "none"};

ValueWords Choices(std::vector<std::string> words) {
  ValueWords values;
  values.kind = Kind::kChoice;
  values.choices = std::move(words);
  return values;
}

ValueWords Of(Kind kind) {
  ValueWords values;
  values.kind = kind;
  return values;
}

// The words of a type like "on|off|status"; empty for a type that is no list of words.
std::vector<std::string> WordsOfType(const std::string& typeName) {
  std::vector<std::string> words;
  if (typeName.find('|') == std::string::npos ||
      std::any_of(typeName.begin(), typeName.end(), [](char c) { return c >= 'A' && c <= 'Z'; })) {
    return words;
  }
  for (std::size_t begin = 0; begin <= typeName.size();) {
    const std::size_t end = std::min(typeName.find('|', begin), typeName.size());
    words.push_back(typeName.substr(begin, end - begin));
    begin = end + 1;
  }
  return words;
}

// The names of the settings, each with what stands behind it.
ValueWords Settings(Kind kind, const char* behind) {
  ValueWords values = Of(kind);
  for (const SettingEntry& setting : kSettingTable) {
    values.choices.push_back(std::string(setting.key) + behind);
  }
  return values;
}

// What the description document offers for a key, and what the driver takes beyond it when that is
// one word.
ValueWords EntriesOf(std::string_view key) {
  const ConfigKey& entry = *FindConfigKey(key);
  std::vector<std::string> words(entry.entries.begin(), entry.entries.end());
  if (!entry.alsoAccepted.empty() && entry.alsoAccepted.find(' ') == std::string_view::npos) {
    words.emplace_back(entry.alsoAccepted);
  }
  return Choices(std::move(words));
}

ValueWords ValuesOf(const std::string& name, const std::string& typeName) {
  static const std::map<std::string, std::string_view> kKeys = {{"--baud", "baudrate"},
                                                                {"--parity", "parity"},
                                                                {"--data-bits", "bits"},
                                                                {"--stop-bits", "stopbits"},
                                                                {"--mode", "mode"}};
  static const std::map<std::string, Kind> kKindsOfNames = {{"--profile", Kind::kProfile},
                                                            {"--instance", Kind::kInstance}};
  static const std::map<std::string, Kind> kKindsOfTypes = {
      {"FILE", Kind::kFile},  {"PATH", Kind::kFile}, {"CONFIG", Kind::kFile}, {"PORT", Kind::kPort},
      {"INPUT", Kind::kFile}, {"URI", Kind::kUri},   {"WORD", Kind::kConsole}};
  if (const auto key = kKeys.find(name); key != kKeys.end()) {
    return EntriesOf(key->second);
  }
  if (const auto kind = kKindsOfNames.find(name); kind != kKindsOfNames.end()) {
    return Of(kind->second);
  }
  if (typeName == "KEY" || typeName == "KEY=VALUE") {
    return typeName == "KEY" ? Settings(Kind::kChoice, "") : Settings(Kind::kKeyValue, "=");
  }
  if (name == "--port" && typeName == "NAME") {
    return EntriesOf("port");
  }
  if (typeName == "BYTES" || typeName == "HEX") {
    return Choices({kControlWords.begin(), kControlWords.end()});
  }
  std::vector<std::string> words = WordsOfType(typeName);
  if (!words.empty()) {
    return Choices(std::move(words));
  }
  const auto kind = kKindsOfTypes.find(typeName);
  return kind == kKindsOfTypes.end() ? ValueWords() : Of(kind->second);
}

bool IsRepeated(const CLI::Option& option) {
  return option.get_expected_max() >= CLI::detail::expected_max_vector_size ||
         option.get_multi_option_policy() == CLI::MultiOptionPolicy::TakeAll;
}

PositionalModel PositionalOf(const CLI::Option& option) {
  PositionalModel model;
  model.name = option.get_name(true, false);
  model.help = option.get_description();
  const std::string typeName = option.get_type_name();
  model.values = ValuesOf("", typeName.empty() ? model.name : typeName);
  model.values.isAlsoProfile = model.values.kind == Kind::kPort;
  model.isRequired = option.get_required();
  model.isRepeated = option.get_expected_max() >= CLI::detail::expected_max_vector_size;
  return model;
}

OptionModel OptionOf(const CLI::Option& option) {
  OptionModel model;
  for (const std::string& name : option.get_snames()) {
    model.names.push_back("-" + name);
  }
  for (const std::string& name : option.get_lnames()) {
    model.names.push_back("--" + name);
  }
  if (option.get_items_expected_max() > 0) {
    model.typeName = option.get_type_name();
    model.values = ValuesOf(model.names.back(), model.typeName);
    model.isRepeated = IsRepeated(option);
  }
  model.defaultText = option.get_default_str();
  model.help = option.get_description();
  model.group = option.get_group();
  return model;
}

// Options of groups that only say which ones exclude each other count as the command's own.
void AddOptions(const CLI::App& app, CommandModel* model) {
  for (const CLI::Option* const option : app.get_options()) {
    if (option->get_group().empty()) {
      continue;
    }
    if (option->get_positional()) {
      model->positionals.push_back(PositionalOf(*option));
    } else {
      model->options.push_back(OptionOf(*option));
    }
  }
}

void Place(const std::string& path, const CommandModel& command,
           std::vector<PlacedCommand>* placed) {
  placed->push_back({path, &command});
  for (const CommandModel& below : command.commands) {
    Place(path + "/" + below.name, below, placed);
  }
}

}  // namespace

CommandModel ModelOf(const CLI::App& app) {
  CommandModel model;
  model.name = app.get_name();
  model.summary = app.get_description();
  model.group = app.get_group();
  model.footer = app.get_footer();
  AddOptions(app, &model);
  for (const CLI::App* const command : app.get_subcommands({})) {
    if (command->get_name().empty()) {
      AddOptions(*command, &model);
    } else if (!command->get_group().empty()) {
      model.commands.push_back(ModelOf(*command));
    }
  }
  return model;
}

std::string KindsToAskFor(const ValueWords& values) {
  switch (values.kind) {
    case Kind::kPort:
      return values.isAlsoProfile ? "ports profiles" : "ports";
    case Kind::kProfile:
      return "profiles";
    case Kind::kInstance:
      return "instances";
    case Kind::kUri:
      return "uris";
    case Kind::kConsole:
      return "console";
    default:
      return "";
  }
}

std::vector<PlacedCommand> AllCommands(const CommandModel& root) {
  std::vector<PlacedCommand> placed;
  Place("", root, &placed);
  return placed;
}
