// SPDX-License-Identifier: Apache-2.0
// The manual pages against the program.
#include <gtest/gtest.h>

#include <CLI/CLI.hpp>
#include <fstream>
#include <iterator>
#include <nlohmann/json.hpp>
#include <regex>
#include <set>
#include <sstream>
#include <variant>

#include "host/base/ChildProcess.h"
#include "host/base/Deadline.h"
#include "host/base/ExitStatusTable.h"
#include "host/commands/CommandTree.h"
#include "host/completion/CommandModel.h"
#include "host/completion/ManualPage.h"
#include "host/events/EventJson.h"
#include "host/events/EventKeys.h"
#include "host/port/PortOptions.h"
#include "tests/host/support/TextParts.h"

namespace {

std::string ReadText(const std::string& name) {
  std::ifstream file(std::string(LOKA_SOURCE_DIR) + "/" + name);
  return {std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>()};
}

std::string Filled(const std::string& name) {
  const CommandTree tree;
  std::string page;
  std::string error;
  EXPECT_TRUE(FillManualPage(ReadText("docs/man/" + name), ModelOf(tree.App()), &page, &error))
      << error;
  return page;
}

std::string WithoutMarks(const std::string& text) {
  std::string plain;
  for (std::size_t i = 0; i < text.size(); ++i) {
    if (text[i] == '\\' && i + 1 < text.size()) {
      plain += text[++i];
    } else if (text[i] != '*' && text[i] != '_') {
      plain += text[i];
    }
  }
  return plain;
}

TEST(ManualPage, HasEveryCommandAndOptionWithItsMeaning) {
  const std::string page = WithoutMarks(Filled("loka.1.scd"));
  const CommandTree tree;
  const CommandModel root = ModelOf(tree.App());
  for (const PlacedCommand& placed : AllCommands(root)) {
    if (placed.path.empty()) {
      continue;
    }
    std::string words = placed.path;
    std::replace(words.begin(), words.end(), '/', ' ');
    EXPECT_TRUE(Holds(page, "\nloka" + words + " [option...]")) << words;
    EXPECT_TRUE(Holds(page, placed.command->summary)) << words;
    for (const OptionModel& option : placed.command->options) {
      std::string names;
      for (const std::string& name : option.names) {
        names += (names.empty() ? "" : ", ") + name;
      }
      const std::string value = option.TakesValue() ? " " + option.typeName : "";
      const std::string entry = "\t" + names + value + "\n\t\t" + option.help;
      const std::string shared = "\n" + names + value + "\n\t" + option.help;
      EXPECT_TRUE(Holds(page, entry) || Holds(page, shared)) << words << ": " << entry;
    }
  }
}

// The prose of the page names options as well.
TEST(ManualPage, NamesNoOptionThatIsNotThere) {
  const CommandTree tree;
  const CommandModel root = ModelOf(tree.App());
  std::set<std::string> known;
  for (const PlacedCommand& placed : AllCommands(root)) {
    for (const OptionModel& option : placed.command->options) {
      known.insert(option.names.begin(), option.names.end());
    }
  }
  EXPECT_GT(known.size(), 40U);
  const std::regex option(R"((^|[\s*,(])(--?[a-zA-Z][a-z-]*))");
  for (const char* const name : {"loka.1.scd", "loka-config.5.scd"}) {
    const std::string page = ReadText(std::string("docs/man/") + name);
    std::size_t count = 0;
    for (std::sregex_iterator found(page.begin(), page.end(), option), end; found != end; ++found) {
      EXPECT_EQ(known.count((*found)[2]), 1U) << name << ": " << (*found)[2];
      ++count;
    }
    EXPECT_GT(count, 2U) << name;
  }
}

TEST(ManualPage, HasEveryExitStatus) {
  const std::string page = WithoutMarks(Filled("loka.1.scd"));
  const std::string header = ReadText("host/base/ExitStatus.h");
  const std::regex value(R"(k\w+ = (\d+),)");
  std::set<int> values;
  for (std::sregex_iterator found(header.begin(), header.end(), value), end; found != end;
       ++found) {
    values.insert(std::stoi((*found)[1]));
  }
  const std::string readme = ReadText("README.md");
  for (const ExitStatusMeaning& entry : kExitStatusTable) {
    EXPECT_EQ(values.erase(static_cast<int>(entry.status)), 1U) << entry.number;
    EXPECT_EQ(std::stoi(entry.number), static_cast<int>(entry.status));
    EXPECT_TRUE(Holds(page, std::string("\n") + entry.number + "\n\t" + entry.meaning + "\n"));
    EXPECT_TRUE(Holds(readme, std::string("| ") + entry.number + " | " + entry.meaning + " |"))
        << entry.number;
  }
  EXPECT_TRUE(values.empty()) << "a status without a meaning";
}

TEST(ManualPage, HasEveryKeyOfEveryEvent) {
  const std::string page = Filled("loka.1.scd");
  EXPECT_EQ(EventKinds().size(), std::variant_size_v<HostEvent::Detail>);
  for (const EventKind& kind : EventKinds()) {
    const std::string line = ExampleLine(kind);
    std::vector<std::string> keys = {"t", "ev", "port"};
    for (const EventKey& key : kind.keys) {
      keys.emplace_back(key.name);
    }
    std::vector<std::string> printed;
    const auto json = nlohmann::json::parse(line);
    for (const auto& [key, value] : json.items()) {
      printed.push_back(key);
    }
    std::sort(keys.begin(), keys.end());
    std::sort(printed.begin(), printed.end());
    EXPECT_EQ(printed, keys) << kind.name;
    EXPECT_TRUE(Holds(page, "```\n" + line + "\n```\n")) << kind.name;
  }
}

// An event that has nothing to say beyond what it must.
TEST(ManualPage, SaysWhichKeysAreNotAlwaysThere) {
  for (const EventKind& kind : EventKinds()) {
    nlohmann::json json = nlohmann::json::parse(ExampleLine(kind));
    std::set<std::string> always = {"t", "ev", "port"};
    for (const EventKey& key : kind.keys) {
      if (key.isOptional) {
        json.erase(key.name);
      } else {
        always.insert(key.name);
      }
    }
    HostEvent event;
    ASSERT_TRUE(FromJson(json, &event)) << kind.name;
    std::set<std::string> printed;
    const auto least = nlohmann::json::parse(ToJsonLine(event));
    for (const auto& [key, value] : least.items()) {
      printed.insert(key);
    }
    EXPECT_EQ(printed, always) << kind.name;
  }
}

TEST(ManualPage, HasEveryPortOption) {
  const std::string page = WithoutMarks(Filled("loka.1.scd"));
  for (const PortOptionEntry& entry : PortOptionTable()) {
    EXPECT_TRUE(Holds(
        page, std::string("\n") + entry.name + "=" + entry.values + "\n\t" + entry.help + "\n"))
        << entry.name;
  }
}

TEST(ManualPage, RefusesAMarkThatIsNone) {
  const CommandTree tree;
  std::string page;
  std::string error;
  EXPECT_FALSE(FillManualPage("@comands@\n", ModelOf(tree.App()), &page, &error));
  EXPECT_EQ(error, "no mark: @comands@");
}

TEST(ManualPage, IsTakenByTheFormatter) {
  for (const std::string name : {"loka.1", "loka-config.5"}) {
    ChildProcess process(
        "/bin/sh", {"sh", "-c",
                    "'" LOKA_PROGRAM_PATH "' manual-page '" LOKA_SOURCE_DIR "/docs/man/" + name +
                        ".scd' | scdoc"});
    std::string text;
    const Deadline deadline = Deadline::After(30000);
    for (std::string line; process.ReadLine(deadline, &line);) {
      text += line + "\n";
    }
    EXPECT_EQ(process.Wait(deadline), 0) << name;
    EXPECT_TRUE(Holds(text, "SEE ALSO")) << name;
    EXPECT_FALSE(Holds(text, "\n@")) << name;
  }
}

}  // namespace
