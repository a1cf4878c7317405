// SPDX-License-Identifier: Apache-2.0
#include "host/commands/CommandTree.h"

#include <CLI/CLI.hpp>
#include <algorithm>
#include <cstdio>
#include <type_traits>
#include <utility>

#include "host/base/ExitStatus.h"
#include "host/commands/CmdCommand.h"
#include "host/commands/CompletionCommand.h"
#include "host/commands/ConfigCommand.h"
#include "host/commands/ConnectCommand.h"
#include "host/commands/DemoCommand.h"
#include "host/commands/DescribeCommand.h"
#include "host/commands/ExplainCommand.h"
#include "host/commands/HelpText.h"
#include "host/commands/PortsCommand.h"
#include "host/commands/ReadCommand.h"
#include "host/commands/RunCommand.h"
#include "host/commands/SendCommand.h"
#include "host/commands/SetCommand.h"
#include "host/commands/SimCommand.h"
#include "host/commands/StoreCommand.h"
#include "host/commands/SubCommand.h"
#include "host/commands/TagsCommand.h"
#include "host/commands/TermCommand.h"
#include "host/commands/WriteCommand.h"
#include "host/sim/SimRun.h"
#include "host/text/Output.h"
#include "host/text/Utf8Text.h"

namespace {

constexpr const char* kVersion = "loka 1.0.0";
constexpr const char* kFooter =
    "Exit status: 0 done, 1 refused, 2 usage, 3 plug-in, 4 configuration, 5 port,\n"
    "6 line gone, 7 difference, 27 not in time, 128+n signal n. Results go to stdout.";

// The groups of the list of commands, in its order; commands of one group stand together.
constexpr const char* kEveryday = "Everyday";
constexpr const char* kTagsAndSettings = "Tags and settings";
constexpr const char* kKnowing = "Knowing";
constexpr const char* kKeeping = "Keeping";
constexpr const char* kHidden = "";

// A command made of its options and two functions.
template <class Options, auto kAdd, auto kRun>
class CommandOf : public Command {
 public:
  void AddTo(CLI::App* app) override { kAdd(app, &options_); }
  int Run() override {
    if constexpr (std::is_invocable_v<decltype(kRun), Options*>) {
      return kRun(&options_);
    } else {
      return kRun(options_);
    }
  }

 protected:
  Options options_;
};

class CmdCommand final : public CommandOf<CmdOptions, AddCmd, RunCmd> {
 public:
  void Prepare(const CLI::App& command, std::vector<std::string>* words) override {
    options_.words = CutConsoleWords(command, words);
  }
};

template <class Options, auto kAdd, auto kRun>
std::unique_ptr<Command> Make() {
  return std::make_unique<CommandOf<Options, kAdd, kRun>>();
}

// CLI11's words in the tool's own frame, with the way to the help of the command that was meant.
std::string WhatIsWrong(const CLI::App* app, const CLI::Error& error) {
  std::string name = "loka";
  const CLI::App* command = app;
  while (!command->get_subcommands().empty()) {
    command = command->get_subcommands().front();
    name += " " + command->get_name();
  }
  return "loka: " + PrintableUtf8(error.what()) + "\nloka: " + name + " --help tells more\n";
}

// Options of every command may stand in front of its name as well; the parser wants them behind it.
void MoveBehindName(std::vector<std::string>* words) {
  constexpr std::string_view kWithValue[] = {"--plugin", "--profile", "--color"};
  constexpr std::string_view kWithout[] = {"-v",      "-vv", "--verbose", "-q",
                                           "--quiet", "-j",  "--json"};
  const auto has = [](const auto& list, const std::string& word) {
    return std::find(std::begin(list), std::end(list), word) != std::end(list);
  };
  std::size_t at = 0;
  while (at < words->size()) {
    const std::string& word = (*words)[at];
    if (has(kWithValue, word)) {
      at += 2;
    } else if (has(kWithout, word) || has(kWithValue, word.substr(0, word.find('=')))) {
      ++at;
    } else {
      break;
    }
  }
  if (at > 0 && at < words->size() && (*words)[at].front() != '-') {
    std::rotate(words->begin(), words->begin() + static_cast<std::ptrdiff_t>(at),
                words->begin() + static_cast<std::ptrdiff_t>(at) + 1);
  }
}

}  // namespace

CommandTree::CommandTree()
    : app_(std::make_unique<CLI::App>("Runs the serial token driver on this machine.", "loka")) {
  app_->set_version_flag("--version", kVersion);
  app_->footer(kFooter);
  app_->require_subcommand(0, 1);
  app_->formatter(std::make_shared<HelpText>());
  app_->failure_message(WhatIsWrong);
  Add(kEveryday, Make<SubOptions, AddSub, RunSub>());
  Add(kEveryday, Make<SendOptions, AddSend, RunSend>());
  Add(kEveryday, Make<AskOptions, AddAsk, RunAsk>());
  Add(kEveryday, Make<TermOptions, AddTerm, RunTerm>());
  Add(kEveryday, std::make_unique<CmdCommand>());
  Add(kEveryday, Make<PortsOptions, AddPorts, RunPorts>());
  Add(kTagsAndSettings, Make<TagsOptions, AddTags, RunTags>());
  Add(kTagsAndSettings, Make<ReadOptions, AddRead, RunRead>());
  Add(kTagsAndSettings, Make<WriteOptions, AddWrite, RunWrite>());
  Add(kTagsAndSettings, Make<SetOptions, AddSet, RunSet>());
  Add(kTagsAndSettings, Make<StoreOptions, AddStore, RunStore>());
  Add(kTagsAndSettings, Make<ConnectOptions, AddConnect, RunConnect>());
  Add(kKnowing, Make<ExplainOptions, AddExplain, RunExplain>());
  Add(kKnowing, Make<DescribeOptions, AddDescribe, RunDescribe>());
  Add(kKnowing, Make<ConfigOptions, AddConfig, RunConfig>());
  Add(kKnowing, Make<StatsOptions, AddStats, RunStats>());
  Add(kKeeping, Make<SimOptions, AddSim, RunSim>());
  Add(kKeeping, Make<RunOptions, AddRun, RunRun>());
  Add(kKeeping, Make<DemoOptions, AddDemo, RunDemo>());
  Add(kKeeping, Make<CompletionOptions, AddCompletion, RunCompletion>());
  Add(kHidden, Make<ManualPageOptions, AddManualPage, RunManualPage>());
  Add(kHidden, Make<WordsOptions, AddWords, RunWords>());
  // The demonstration's own other processes.
  Add(kHidden, Make<DemoDeviceOptions, AddDemoDevice, RunDemoDeviceProcess>());
  Add(kHidden, Make<DemoRestartedOptions, AddDemoRestarted, RunDemoRestartedProcess>());
}

CommandTree::~CommandTree() = default;

void CommandTree::Add(const char* group, std::unique_ptr<Command> command) {
  command->AddTo(app_.get());
  CLI::App* const added = app_->get_subcommands({}).back();
  added->group(group);
  added->footer(added->get_footer() + "\n" + kFooter);
  entries_.push_back({added, std::move(command)});
}

CommandTree::Entry* CommandTree::Find(const std::string& name) {
  const auto entry = std::find_if(entries_.begin(), entries_.end(), [&](const Entry& candidate) {
    return candidate.app->check_name(name);
  });
  return entry == entries_.end() ? nullptr : &*entry;
}

bool CommandTree::Parse(std::vector<std::string> words, int* status) {
  MoveBehindName(&words);
  Entry* const entry = words.empty() ? nullptr : Find(words.front());
  if (entry != nullptr) {
    entry->command->Prepare(*entry->app, &words);
  } else if (!words.empty() && words.front().rfind('-', 0) != 0) {
    TellUser("there is no command '" + PrintableUtf8(words.front()) + "'; loka --help lists them");
    *status = static_cast<int>(ExitStatus::kUsage);
    return false;
  }
  // CLI11 takes a vector from its back.
  std::reverse(words.begin(), words.end());
  try {
    app_->parse(words);
  } catch (const CLI::ParseError& error) {
    *status = static_cast<int>(app_->exit(error) == 0 ? ExitStatus::kDone : ExitStatus::kUsage);
    return false;
  }
  if (app_->get_subcommands().empty()) {
    (void)std::fprintf(stderr, "%s", app_->help().c_str());
    *status = static_cast<int>(ExitStatus::kUsage);
    return false;
  }
  return true;
}

int CommandTree::Run() {
  Entry* const entry = Find(app_->get_subcommands().front()->get_name());
  return entry->command->Run();
}
