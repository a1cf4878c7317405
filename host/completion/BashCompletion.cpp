// SPDX-License-Identifier: Apache-2.0
#include "host/completion/BashCompletion.h"

#include <map>
#include <vector>

#include "host/completion/CommandModel.h"

namespace {

std::string Join(const std::vector<std::string>& words, const char* between) {
  std::string text;
  for (const std::string& word : words) {
    text += (text.empty() ? "" : between) + word;
  }
  return text;
}

// What the script is to do for a value, as its function _loka_offer reads it.
std::string Offer(const ValueWords& values) {
  switch (values.kind) {
    case ValueWords::Kind::kNothing:
      return "nothing";
    case ValueWords::Kind::kFile:
      return "files";
    case ValueWords::Kind::kChoice:
    case ValueWords::Kind::kKeyValue:
      return "these " + Join(values.choices, " ");
    case ValueWords::Kind::kPort:
      return "ask-or-files " + KindsToAskFor(values);
    default:
      return "ask " + KindsToAskFor(values);
  }
}

// A function that prints a text for a word; patterns with the same text share a line.
std::string Table(const std::string& function, const std::map<std::string, std::string>& lines) {
  std::map<std::string, std::vector<std::string>> patterns;
  for (const auto& [pattern, text] : lines) {
    patterns[text].push_back("'" + pattern + "'");
  }
  std::string script = function + "() {\n  case $1 in\n";
  for (const auto& [text, words] : patterns) {
    script += "    " + Join(words, " | \\\n      ") + ")\n      echo '" + text + "' ;;\n";
  }
  return script + "  esac\n}\n\n";
}

std::string Tables(const CommandModel& root) {
  std::map<std::string, std::string> commands;
  std::map<std::string, std::string> options;
  std::map<std::string, std::string> values;
  for (const PlacedCommand& placed : AllCommands(root)) {
    const CommandModel& command = *placed.command;
    std::vector<std::string> words;
    for (const CommandModel& below : command.commands) {
      words.push_back(below.name);
    }
    if (!words.empty()) {
      commands[placed.path] = Join(words, " ");
    }
    words.clear();
    for (const OptionModel& option : command.options) {
      for (const std::string& name : option.names) {
        words.push_back(name);
        if (option.TakesValue()) {
          values[placed.path + " " + name] = Offer(option.values);
        }
      }
    }
    options[placed.path] = Join(words, " ");
    // Behind a positional that may be left out stands the next one as well.
    std::string offers;
    for (std::size_t i = command.positionals.size(); i > 0; --i) {
      const PositionalModel& positional = command.positionals[i - 1];
      const bool isLeftOut = !positional.isRequired && !offers.empty();
      if (isLeftOut) {
        offers.insert(0, ";");
      } else {
        offers.clear();
      }
      offers.insert(0, Offer(positional.values));
      values[placed.path + " " + std::to_string(i)] = offers;
    }
    if (!command.positionals.empty() && command.positionals.back().isRepeated) {
      values[placed.path + " more"] = Offer(command.positionals.back().values);
    }
  }
  return Table("_loka_commands", commands) + Table("_loka_options", options) +
         Table("_loka_values", values);
}

constexpr const char* kBashHead = R"(# SPDX-License-Identifier: Apache-2.0
# Completion for loka in bash, written by "loka completion bash".

)";

// Words of this machine are compared and quoted by hand: compgen -W would expand what is in them.
constexpr const char* kFunctions =
    R"sh(# _loka_match WORD...: those that begin with what stands at the cursor.
_loka_match() {
  local word
  for word; do
    [[ $word == "$_loka_current"* ]] || continue
    COMPREPLY+=("$(printf '%q' "$word")")
    [[ $word == *= ]] && compopt -o nospace 2>/dev/null
  done
}

# _loka_ask PROGRAM KIND...: words that only this machine knows.
_loka_ask() {
  local program=$1 kind words
  shift
  for kind; do
    mapfile -t words < <("$program" words "$kind" 2>/dev/null)
    _loka_match "${words[@]}"
  done
}

_loka_files() {
  local names
  mapfile -t names < <(compgen -f -- "$_loka_current")
  COMPREPLY+=("${names[@]}")
  compopt -o filenames 2>/dev/null
}

# _loka_offer PROGRAM "these WORD..." | "ask KIND..." | "files" | "nothing", several with ";".
_loka_offer() {
  local program=$1 offers offer words
  IFS=';' read -ra offers <<<"$2"
  for offer in "${offers[@]}"; do
    read -ra words <<<"$offer"
    case ${words[0]} in
      these) _loka_match "${words[@]:1}" ;;
      ask) _loka_ask "$program" "${words[@]:1}" ;;
      ask-or-files)
        if [[ $_loka_current == */* ]]; then
          _loka_files
        else
          _loka_ask "$program" "${words[@]:1}"
        fi
        ;;
      files) _loka_files ;;
    esac
  done
}

_loka() {
  local program=$1 path='' option='' joined='' places=0 at word offer
  local _loka_current=${COMP_WORDS[COMP_CWORD]}
  COMPREPLY=()
  for ((at = 1; at < COMP_CWORD; at++)); do
    word=${COMP_WORDS[at]}
    if [[ $word == [=:] ]]; then # bash cuts words there
      [[ -n $option ]] || joined=yes
    elif [[ -n $joined ]]; then
      joined=''
    elif [[ -n $option ]]; then
      option=''
    elif [[ $word == -* ]]; then
      # In front of the command stand options that every command knows, sub among them.
      [[ -n $(_loka_values "${path:-/sub} $word") ]] && option=$word
    elif [[ " $(_loka_commands "$path") " == *" $word "* ]]; then
      path+="/$word"
    else
      places=$((places + 1))
    fi
  done
  [[ $_loka_current == [=:] ]] && joined=yes _loka_current=''
  if [[ -n $option ]]; then
    _loka_offer "$program" "$(_loka_values "${path:-/sub} $option")"
  elif [[ -n $joined ]]; then
    [[ $path == */set ]] || _loka_files
  elif [[ $_loka_current == -* ]]; then
    read -ra offer <<<"$(_loka_options "$path")"
    _loka_match "${offer[@]}"
  else
    read -ra offer <<<"$(_loka_commands "$path")"
    _loka_match "${offer[@]}"
    offer=$(_loka_values "$path $((places + 1))")
    _loka_offer "$program" "${offer:-$(_loka_values "$path more")}"
  fi
}

complete -F _loka loka
)sh";

}  // namespace

std::string BashCompletion(const CommandModel& root) {
  return kBashHead + Tables(root) + kFunctions;
}
