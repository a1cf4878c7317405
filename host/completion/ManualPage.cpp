// SPDX-License-Identifier: Apache-2.0
#include "host/completion/ManualPage.h"

#include <algorithm>
#include <functional>
#include <map>
#include <sstream>

#include "host/base/ExitStatusTable.h"
#include "host/completion/CommandModel.h"
#include "host/events/EventKeys.h"
#include "host/framing/ConfigKeyTable.h"
#include "host/instance/SettingTable.h"
#include "host/port/PortOptions.h"

namespace {

// Characters that scdoc takes as marks.
std::string Plain(std::string_view text) {
  std::string escaped;
  for (const char c : text) {
    if (c == '_' || c == '*' || c == '\\' || c == '#' || c == '.' || c == '\'' || c == '~' ||
        c == '`' || c == '<' || c == '[') {
      escaped += '\\';
    }
    escaped += c;
  }
  return escaped;
}

std::string Bold(const std::string& text) { return "*" + Plain(text) + "*"; }

// "on|off" is a list of words to type, "N" a place for a value.
std::string TypeText(const std::string& typeName) {
  return typeName.find('|') == std::string::npos ? "_" + Plain(typeName) + "_" : Plain(typeName);
}

std::string Row(std::initializer_list<std::string> cells) {
  std::string text;
  for (const std::string& cell : cells) {
    text += std::string(text.empty() ? "|" : ":") + "[ " + cell + "\n";
  }
  return text;
}

std::string Head(std::initializer_list<std::string> cells) {
  std::string text;
  for (const std::string& cell : cells) {
    text += std::string(text.empty() ? "[" : ":") + "[ *" + cell + "*\n";
  }
  return text;
}

std::string OptionEntry(const OptionModel& option) {
  std::string line;
  for (const std::string& name : option.names) {
    line += (line.empty() ? "" : ", ") + Bold(name);
  }
  line += option.TakesValue() ? " " + TypeText(option.typeName) : "";
  const std::string usual =
      option.defaultText.empty() ? "" : " [" + Plain(option.defaultText) + "]";
  return line + "\n\t" + Plain(option.help) + usual + "\n\n";
}

// Options that are the same in at least so many commands are written once.
constexpr int kShared = 5;

class CommandWriter {
 public:
  explicit CommandWriter(const CommandModel& root) : all_(AllCommands(root)) {
    for (const PlacedCommand& placed : all_) {
      for (const OptionModel& option : placed.command->options) {
        ++uses_[OptionEntry(option)];
      }
    }
  }

  std::string SharedOptions() const {
    std::map<std::string, std::string> groups;
    std::vector<std::string> order;
    std::vector<std::string> seen;
    for (const PlacedCommand& placed : all_) {
      for (const OptionModel& option : placed.command->options) {
        const std::string entry = OptionEntry(option);
        if (!IsShared(option) || std::find(seen.begin(), seen.end(), entry) != seen.end()) {
          continue;
        }
        seen.push_back(entry);
        const std::string group = option.group == "Options" ? "Everywhere" : option.group;
        if (!groups.contains(group)) {
          order.push_back(group);
        }
        groups[group] += entry;
      }
    }
    std::string text;
    for (const std::string& group : order) {
      text += "## " + group + "\n\n" + groups[group];
    }
    return text;
  }

  std::string Commands() const {
    std::string text;
    std::string group;
    for (const PlacedCommand& placed : all_) {
      if (placed.path.empty()) {
        continue;
      }
      const bool isTop = placed.path.find('/', 1) == std::string::npos;
      if (isTop && placed.command->group != group) {
        group = placed.command->group;
        text += "## " + group + "\n\n";
      }
      text += CommandText(placed);
    }
    return text;
  }

 private:
  bool IsShared(const OptionModel& option) const {
    return uses_.at(OptionEntry(option)) >= kShared;
  }

  static std::string WordsOf(const std::string& path) {
    std::string words = path.substr(1);
    std::replace(words.begin(), words.end(), '/', ' ');
    return words;
  }

  static std::string Usage(const PlacedCommand& placed) {
    std::string text = "*loka " + WordsOf(placed.path) + "*";
    if (!placed.command->options.empty()) {
      text += " [_option_...]";
    }
    for (const PositionalModel& positional : placed.command->positionals) {
      const std::string word =
          "_" + Plain(positional.name) + "_" + (positional.isRepeated ? "..." : "");
      text += positional.isRequired ? " " + word : " [" + word + "]";
    }
    return text + (placed.command->commands.empty() ? "" : " _command_ ...");
  }

  std::string CommandText(const PlacedCommand& placed) const {
    const CommandModel& command = *placed.command;
    std::string text = Usage(placed) + "\n\n\t" + Plain(command.summary) + ".\n\n";
    for (const PositionalModel& positional : command.positionals) {
      text += "\t_" + Plain(positional.name) + "_\n\t\t" + Plain(positional.help) + "\n\n";
    }
    bool hasShared = false;
    for (const OptionModel& option : command.options) {
      if (IsShared(option)) {
        hasShared = hasShared || option.group != "Options";
        continue;
      }
      std::istringstream lines(OptionEntry(option));
      for (std::string line; std::getline(lines, line);) {
        text += line.empty() ? "\n" : "\t" + line + "\n";
      }
    }
    text += hasShared ? "\tThe *OPTIONS* of ports, instances and framing belong to it.\n\n" : "";
    return text + Examples(command.footer);
  }

  static std::string Examples(const std::string& footer) {
    const std::string mark = "Example:";
    std::string text;
    std::istringstream lines(footer);
    for (std::string line; std::getline(lines, line);) {
      if (line.rfind(mark, 0) == 0) {
        const std::size_t begin = line.find_first_not_of(' ', mark.size());
        text += "\tExample: *" + Plain(line.substr(begin)) + "*\n\n";
      }
    }
    return text;
  }

  std::vector<PlacedCommand> all_;
  std::map<std::string, int> uses_;
};

std::string ExitStatusRows() {
  std::string text;
  for (const ExitStatusMeaning& entry : kExitStatusTable) {
    text += Bold(entry.number) + "\n\t" + Plain(entry.meaning) + "\n\n";
  }
  return text;
}

std::string EventEntries() {
  std::string text;
  for (const EventKind& kind : EventKinds()) {
    text += "*" + std::string(kind.name) + "*\n\t" + Plain(kind.meaning) + "\n\n";
    for (const EventKey& key : kind.keys) {
      text += "\t" + Bold(key.name) + (key.isOptional ? " (not always)" : "") + "\n\t\t" +
              Plain(key.meaning) + "\n\n";
    }
    text += "```\n" + ExampleLine(kind) + "\n```\n\n";
  }
  return text;
}

std::string PortOptionEntries() {
  std::string text;
  for (const PortOptionEntry& entry : PortOptionTable()) {
    text +=
        "*" + Plain(entry.name) + "*=" + Plain(entry.values) + "\n\t" + Plain(entry.help) + "\n\n";
  }
  return text;
}

std::string ConfigurationKeys() {
  std::string text;
  for (const ConfigKey& key : ConfigKeys()) {
    text += "*" + Plain(key.key) + "*\n\t" + Plain(key.meaning) +
            ". Values: " + Plain(key.AllowedText()) + ".";
    text += key.alsoAccepted.empty() ? "" : " Taken as well: " + Plain(key.alsoAccepted) + ".";
    text += key.isMandatory           ? " Must be there; usually " + Plain(key.defaultText) + "."
            : key.defaultText.empty() ? " Without it: none."
                                      : " Without it: " + Plain(key.defaultText) + ".";
    text += "\n\n";
  }
  return text;
}

std::string SettingEntries() {
  std::string text = Head({"Setting", "Key", "Tag"});
  for (const SettingEntry& setting : kSettingTable) {
    text += Row({Plain(setting.key), Plain(setting.configKey), Plain(TagUri(setting))});
  }
  return text;
}

}  // namespace

bool FillManualPage(const std::string& page, const CommandModel& root, std::string* filled,
                    std::string* error) {
  const CommandWriter writer(root);
  const std::map<std::string, std::function<std::string()>> marks = {
      {"@commands@", [&] { return writer.Commands(); }},
      {"@shared-options@", [&] { return writer.SharedOptions(); }},
      {"@exit-status@", ExitStatusRows},
      {"@events@", EventEntries},
      {"@port-options@", PortOptionEntries},
      {"@configuration-keys@", ConfigurationKeys},
      {"@settings@", SettingEntries}};
  std::string text;
  std::istringstream lines(page);
  for (std::string line; std::getline(lines, line);) {
    if (line.empty() || line.front() != '@') {
      text += line + "\n";
      continue;
    }
    const auto mark = marks.find(line);
    if (mark == marks.end()) {
      *error = "no mark: " + line;
      return false;
    }
    text += mark->second();
  }
  *filled = text;
  return true;
}
