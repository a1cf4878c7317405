// SPDX-License-Identifier: Apache-2.0
#include "host/completion/ZshCompletion.h"

#include <algorithm>
#include <vector>

#include "host/completion/CommandModel.h"

namespace {

constexpr const char* kZshHead = R"zsh(#compdef loka
# SPDX-License-Identifier: Apache-2.0
# Completion for loka in zsh, written by "loka completion zsh".

# _loka_ask KIND...: words that only this machine knows.
_loka_ask() {
  local kind
  local -a known
  for kind in "$@"; do
    known=("${(@f)$($_loka_program words $kind 2>/dev/null)}")
    known=(${known:#})
    compadd -M 'r:|/=* r:|=*' -a known
  done
}

# A path is typed out; what is no path yet can be a word that this machine knows.
_loka_ask_or_files() {
  _loka_ask "$@"
  _files
}

_loka_key_values() {
  compadd -S '' -- "$@"
}

)zsh";

constexpr const char* kTail = R"zsh(_loka() {
  local _loka_program=$words[1]
  _loka_at_
}

_loka "$@"
)zsh";

std::string Replaced(std::string text, const std::string& from, const std::string& to) {
  for (std::size_t at = text.find(from); at != std::string::npos;
       at = text.find(from, at + to.size())) {
    text.replace(at, from.size(), to);
  }
  return text;
}

// A text inside single quotes.
std::string ZshQuoted(const std::string& text) {
  return "'" + Replaced(text, "'", R"('\'')") + "'";
}

// A help text inside the brackets of a specification, or behind the colon of a list.
std::string Help(const std::string& text) {
  std::string escaped = Replaced(text, "\\", "\\\\");
  for (const char* const mark : {"[", "]", ":"}) {
    escaped = Replaced(escaped, mark, std::string("\\") + mark);
  }
  return escaped;
}

std::string Action(const ValueWords& values) {
  std::string words;
  for (const std::string& word : values.choices) {
    words += (words.empty() ? "" : " ") + word;
  }
  switch (values.kind) {
    case ValueWords::Kind::kNothing:
      return " ";
    case ValueWords::Kind::kChoice:
      return "(" + words + ")";
    case ValueWords::Kind::kKeyValue:
      return "_loka_key_values " + words;
    case ValueWords::Kind::kFile:
      return "_files";
    case ValueWords::Kind::kPort:
      return "_loka_ask_or_files " + KindsToAskFor(values);
    default:
      return "_loka_ask " + KindsToAskFor(values);
  }
}

// A name as it stands in a specification, with the mark for a value behind it.
std::string Named(const std::string& name, bool takesValue) {
  const bool isLong = name.rfind("--", 0) == 0;
  return name + (!takesValue ? "" : isLong ? "=" : "+");
}

std::string OptionLines(const OptionModel& option) {
  std::string all;
  for (const std::string& name : option.names) {
    all += (all.empty() ? "" : " ") + name;
  }
  const std::string before = option.isRepeated ? "*" : "(" + all + ")";
  const std::string value =
      option.TakesValue() ? ":" + Help(option.typeName) + ":" + Action(option.values) : "";
  const std::string behind = "[" + Help(option.help) + "]" + value;
  std::string lines;
  for (const std::string& name : option.names) {
    std::string argument = before;
    argument.append(Named(name, option.TakesValue())).append(behind);
    lines.append(" \\\n    ").append(ZshQuoted(argument));
  }
  return lines;
}

std::string PositionalLine(const PositionalModel& positional, const std::string& action) {
  const std::string place = positional.isRepeated ? "*:" : positional.isRequired ? ":" : "::";
  return " \\\n    " + ZshQuoted(place + Help(positional.name) + ":" + action);
}

std::string FunctionName(const std::string& path) {
  std::string name = "_loka_at" + path;
  std::replace(name.begin(), name.end(), '/', '_');
  return path.empty() ? name + "_" : name;
}

std::string Positionals(const CommandModel& command) {
  std::string lines;
  for (const PositionalModel& positional : command.positionals) {
    lines += PositionalLine(positional, Action(positional.values));
  }
  return lines;
}

// In front of the command stand options that every command with a driver knows.
std::string LeadingOptions(const CommandModel& root) {
  constexpr const char* kNames[] = {"--plugin",  "--profile", "--color",
                                    "--verbose", "--quiet",   "--json"};
  std::string lines;
  for (const OptionModel& option : root.commands.front().options) {
    const bool isLeading =
        std::find(std::begin(kNames), std::end(kNames), option.names.back()) != std::end(kNames);
    lines += isLeading ? OptionLines(option) : "";
  }
  return lines;
}

std::string FunctionOf(const std::string& path, const CommandModel& command) {
  std::string options = path.empty() ? LeadingOptions(command) : "";
  for (const OptionModel& option : command.options) {
    options += OptionLines(option);
  }
  std::string text = FunctionName(path) + "() {\n";
  if (command.commands.empty()) {
    return text + "  _arguments -s -S" + options + Positionals(command) + "\n}\n\n";
  }
  std::string list;
  std::string cases;
  for (const CommandModel& below : command.commands) {
    list += "\n        " + ZshQuoted(Help(below.name) + ":" + below.summary);
    cases += "\n        " + below.name + ") " + FunctionName(path + "/" + below.name) + " ;;";
  }
  return text + "  local context state line\n  typeset -A opt_args\n  _arguments -C" + options +
         " \\\n    '1:command:->command' \\\n    '*::argument:->argument'\n" +
         "  case $state in\n    command)\n      local -a commands=(" + list +
         "\n      )\n      _describe -t commands command commands\n      ;;\n" +
         "    argument)\n      case $words[1] in" + cases + "\n      esac\n      ;;\n  esac\n}\n\n";
}

}  // namespace

std::string ZshCompletion(const CommandModel& root) {
  std::string text = kZshHead;
  for (const PlacedCommand& placed : AllCommands(root)) {
    text += FunctionOf(placed.path, *placed.command);
  }
  return text + kTail;
}
