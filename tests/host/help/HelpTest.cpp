// SPDX-License-Identifier: Apache-2.0
// What --help shows of every command.
#include <gtest/gtest.h>

#include <CLI/CLI.hpp>
#include <regex>
#include <set>
#include <sstream>

#include "host/commands/CommandTree.h"
#include "host/commands/HelpText.h"
#include "host/completion/CommandModel.h"

namespace {

std::vector<std::string> LinesOf(const std::string& text) {
  std::vector<std::string> lines;
  std::istringstream stream(text);
  for (std::string line; std::getline(stream, line);) {
    lines.push_back(line);
  }
  return lines;
}

// The help of all commands, hidden ones left out, by "loka config new".
void CollectHelp(const CLI::App& app, const std::string& name,
                 std::vector<std::pair<std::string, std::string>>* all) {
  all->emplace_back(name, app.help(name.substr(0, name.rfind(' '))));
  for (const CLI::App* const command : app.get_subcommands({})) {
    if (!command->get_name().empty() && !command->get_group().empty()) {
      CollectHelp(*command, name + " " + command->get_name(), all);
    }
  }
}

TEST(Help, TheListOfCommandsFitsASmallTerminal) {
  const CommandTree tree;
  const std::vector<std::string> lines = LinesOf(tree.App().help());
  EXPECT_LE(lines.size(), 24U);
  for (const std::string& line : lines) {
    EXPECT_LE(line.size(), 80U) << line;
  }
}

TEST(Help, CommandsStandInTheirGroups) {
  const CommandTree tree;
  std::set<std::string> groups;
  std::string last;
  for (const CommandModel& command : ModelOf(tree.App()).commands) {
    if (command.group != last) {
      EXPECT_TRUE(groups.insert(command.group).second) << command.name << " stands apart";
      last = command.group;
    }
  }
  EXPECT_EQ(groups, (std::set<std::string>{"Everyday", "Tags and settings", "Knowing", "Keeping"}));
}

TEST(Help, NoLineIsLongerThanATerminalIsWide) {
  const CommandTree tree;
  std::vector<std::pair<std::string, std::string>> all;
  CollectHelp(tree.App(), "loka", &all);
  EXPECT_GT(all.size(), 20U);
  for (const auto& [name, help] : all) {
    for (const std::string& line : LinesOf(help)) {
      EXPECT_LE(line.size(), HelpText::kMaxHelpColumns) << name << ": " << line;
    }
  }
}

TEST(Help, EveryCommandHasASummaryHelpForEachOptionAndAnExample) {
  const CommandTree tree;
  const CommandModel root = ModelOf(tree.App());
  for (const PlacedCommand& placed : AllCommands(root)) {
    if (placed.path.empty()) {
      continue;
    }
    EXPECT_NE(placed.command->summary, "") << placed.path;
    EXPECT_TRUE(std::regex_search(placed.command->footer, std::regex("(^|\n)Example: +loka ")))
        << placed.path;
    for (const OptionModel& option : placed.command->options) {
      EXPECT_NE(option.help, "") << placed.path << " " << option.names.front();
    }
    for (const PositionalModel& positional : placed.command->positionals) {
      EXPECT_NE(positional.help, "") << placed.path << " " << positional.name;
    }
  }
}

}  // namespace
