// SPDX-License-Identifier: Apache-2.0
#include "host/commands/HelpText.h"

#include <sstream>
#include <string_view>
#include <vector>

namespace {

constexpr std::size_t kOptionColumn = 30;
// The longest word of a group's name, and the longest name of a command.
constexpr std::size_t kGroupColumn = 10;
constexpr std::size_t kCommandColumn = 12;

std::string Padded(std::string text, std::size_t columns) {
  text.resize(std::max(text.size() + 1, columns), ' ');
  return text;
}

// Cuts at blanks into lines of at most `columns`; a word that is longer keeps its line.
std::vector<std::string> Wrapped(const std::string& text, std::size_t columns) {
  std::vector<std::string> lines(1);
  std::istringstream words(text);
  for (std::string word; words >> word;) {
    std::string& last = lines.back();
    if (last.empty()) {
      last = word;
    } else if (last.size() + 1 + word.size() <= columns) {
      last += ' ' + word;
    } else {
      lines.push_back(word);
    }
  }
  return lines;
}

// One line a command; the name of its group stands beside the first ones.
std::string CommandList(const CLI::App& app) {
  std::string text;
  std::string group;
  std::vector<std::string> label;
  for (const CLI::App* const command : app.get_subcommands({})) {
    if (command->get_group().empty()) {
      continue;
    }
    if (command->get_group() != group) {
      group = command->get_group();
      label = Wrapped(group, kGroupColumn - 1);
    }
    const std::string beside = label.empty() ? "" : label.front();
    if (!label.empty()) {
      label.erase(label.begin());
    }
    text += Padded(beside, kGroupColumn) + Padded(command->get_name(), kCommandColumn) +
            command->get_description() + "\n";
  }
  return text;
}

}  // namespace

std::string HelpText::make_help(const CLI::App* app, std::string name,
                                CLI::AppFormatMode mode) const {
  if (app->get_parent() == nullptr) {
    return app->get_description() + " " + name + " COMMAND --help tells more.\n" +
           CommandList(*app) + make_footer(app);
  }
  std::string text = CLI::Formatter::make_help(app, std::move(name), mode);
  for (std::size_t at = text.find("\n\n\n"); at != std::string::npos;
       at = text.find("\n\n\n", at)) {
    text.erase(at, 1);
  }
  return text;
}

std::string HelpText::make_option(const CLI::Option* option, bool isPositional) const {
  const std::string left = "  " + make_option_name(option, isPositional) + make_option_opts(option);
  std::string text = left;
  const std::string help = make_option_desc(option);
  if (!help.empty()) {
    std::size_t used = left.size();
    for (const std::string& line : Wrapped(help, kMaxHelpColumns - kOptionColumn)) {
      text += used >= kOptionColumn ? "\n" + std::string(kOptionColumn, ' ') + line
                                    : std::string(kOptionColumn - used, ' ') + line;
      used = kMaxHelpColumns;
    }
  }
  return text + "\n";
}

// Lines of the footer that are too long are wrapped.
std::string HelpText::make_footer(const CLI::App* app) const {
  std::string text;
  std::istringstream footer(app->get_footer());
  for (std::string line; std::getline(footer, line);) {
    if (line.size() <= kMaxHelpColumns) {
      text += line + "\n";
      continue;
    }
    for (const std::string& part : Wrapped(line, kMaxHelpColumns)) {
      text += part + "\n";
    }
  }
  return text;
}

// Which options exclude one another is told when both are given; in a list it is noise.
std::string HelpText::make_option_opts(const CLI::Option* option) const {
  const std::string text = CLI::Formatter::make_option_opts(option);
  return text.substr(0, text.find(" Excludes:"));
}
