// SPDX-License-Identifier: Apache-2.0
#include "host/completion/FishCompletion.h"

#include "host/completion/CommandModel.h"

namespace {

constexpr const char* kFishHead = R"fish(# SPDX-License-Identifier: Apache-2.0
# Completion for loka in fish, written by "loka completion fish".

# __loka_ask KIND...: words that only this machine knows.
function __loka_ask
    set -l program (commandline -opc)[1]
    for kind in $argv
        command $program words $kind 2>/dev/null
    end
end

# __loka_at PATH: whether the cursor stands behind that command and none below it.
function __loka_at
    set -l path ''
    for word in (commandline -opc)[2..-1]
        if contains -- "$path/$word" $__loka_paths
            set path "$path/$word"
        end
    end
    test "$path" = "$argv[1]"
end

)fish";

std::string FishQuoted(const std::string& text) {
  std::string quoted = "'";
  for (const char c : text) {
    if (c == '\'' || c == '\\') {
      quoted += '\\';
    }
    quoted += c;
  }
  return quoted + "'";
}

std::string Join(const std::vector<std::string>& words) {
  std::string text;
  for (const std::string& word : words) {
    text += (text.empty() ? "" : " ") + word;
  }
  return text;
}

// The words that can stand for a value, as fish lists them; empty for none and for files.
std::string Words(const ValueWords& values) {
  const std::string kinds = KindsToAskFor(values);
  return kinds.empty() ? Join(values.choices) : "(__loka_ask " + kinds + ")";
}

bool AreFiles(const ValueWords& values) {
  return values.kind == ValueWords::Kind::kFile || values.kind == ValueWords::Kind::kPort;
}

// Whether a value follows, whether files are offered for it, and which words.
std::string Value(const ValueWords& values) {
  const std::string words = Words(values);
  return std::string(AreFiles(values) ? " -r -F" : " -x") +
         (words.empty() ? "" : " -a " + FishQuoted(words));
}

std::string OptionLine(const std::string& begin, const OptionModel& option) {
  std::string line = begin;
  for (const std::string& name : option.names) {
    const bool isLong = name.rfind("--", 0) == 0;
    line += (isLong ? " -l " : " -s ") + name.substr(isLong ? 2 : 1);
  }
  if (option.TakesValue()) {
    line += Value(option.values);
  }
  return line + " -d " + FishQuoted(option.help) + "\n";
}

std::string LinesOf(const PlacedCommand& placed) {
  const CommandModel& command = *placed.command;
  const std::string begin = "complete -c loka -n " + FishQuoted("__loka_at '" + placed.path + "'");
  std::string lines;
  for (const CommandModel& below : command.commands) {
    lines += begin + " -a " + below.name + " -d " + FishQuoted(below.summary) + "\n";
  }
  for (const OptionModel& option : command.options) {
    lines += OptionLine(begin, option);
  }
  for (const PositionalModel& positional : command.positionals) {
    const std::string words = Words(positional.values);
    lines += words.empty() ? "" : begin + " -a " + FishQuoted(words) + "\n";
    lines += AreFiles(positional.values) ? begin + " -F\n" : "";
  }
  return lines;
}

}  // namespace

std::string FishCompletion(const CommandModel& root) {
  std::string paths;
  std::string lines;
  for (const PlacedCommand& placed : AllCommands(root)) {
    paths += placed.path.empty() ? "" : " " + placed.path;
    lines += LinesOf(placed);
  }
  return kFishHead + ("set -g __loka_paths" + paths + "\n\ncomplete -c loka -f\n") + lines;
}
