// SPDX-License-Identifier: Apache-2.0
#include "host/commands/CompletionCommand.h"

#include <CLI/CLI.hpp>
#include <fstream>
#include <iterator>
#include <sstream>
#include <vector>

#include "host/base/ExitStatus.h"
#include "host/commands/CommandTree.h"
#include "host/commands/ProfileFile.h"
#include "host/completion/BashCompletion.h"
#include "host/completion/CommandModel.h"
#include "host/completion/FishCompletion.h"
#include "host/completion/ManualPage.h"
#include "host/completion/ZshCompletion.h"
#include "host/control/ControlPath.h"
#include "host/document/DescriptionBlock.h"
#include "host/document/DescriptionDocument.h"
#include "host/instance/SettingTable.h"
#include "host/port/PortList.h"
#include "host/runtime/HostSession.h"
#include "host/runtime/SessionConsole.h"
#include "host/text/Output.h"
#include "host/text/Utf8Text.h"
#include "interfaces/IProtocol.h"

namespace {

using Words = std::vector<std::string>;

Words Ports() {
  Words words;
  for (const ListedPort& port : ListPorts()) {
    words.push_back(port.path);
    if (!port.alias.empty()) {
      words.push_back(port.alias);
    }
  }
  return words;
}

Words NamesOfProfiles() {
  std::vector<Profile> profiles;
  std::string error;
  Words words;
  if (ReadProfiles(ProfileFiles(), &profiles, &error)) {
    for (const Profile& profile : profiles) {
      words.push_back(profile.name);
    }
  }
  return words;
}

// The first word of each line of the driver's help.
Words ConsoleCommands(const std::string& pluginFile) {
  HostOptions host;
  host.pluginFile = pluginFile;
  HostSession session(host);
  Words words;
  if (session.Open().IsDone()) {
    std::istringstream help(SessionConsole(&session).Run("help").text);
    for (std::string line; std::getline(help, line);) {
      words.push_back(line.substr(0, line.find_first_of(" \t")));
    }
  }
  return words;
}

// The address of each memory type of the driver's description.
Words Uris(const std::string& pluginFile) {
  HostOptions host;
  host.pluginFile = pluginFile;
  HostSession session(host);
  DescriptionBlock block;
  DescriptionDocument document;
  std::string error;
  if (!session.Open().IsDone() || session.Protocol()->GetXml() == nullptr ||
      !ReadDescriptionAt(session.Protocol()->GetXml(), &block, &error) ||
      !ParseDescription(block.xml, &document, &error)) {
    return {};
  }
  Words words;
  for (const DescriptionDocument::MemoryType& type : document.memoryTypes) {
    const SettingEntry* const setting = FindSettingOfMemoryType(type.name);
    // A row of bytes is shown as a text; the length is the user's choice.
    const std::string dataType = type.naturalType == "byte" ? "string-64" : type.naturalType;
    words.push_back(setting != nullptr ? TagUri(*setting) : "0?" + type.name + "?" + dataType);
  }
  return words;
}

Words WordsOf(const WordsOptions& options) {
  if (options.kind == "ports") {
    return Ports();
  }
  if (options.kind == "profiles") {
    return NamesOfProfiles();
  }
  if (options.kind == "instances") {
    return ControlNames();
  }
  if (options.kind == "uris") {
    return Uris(options.pluginFile);
  }
  return options.kind == "console" ? ConsoleCommands(options.pluginFile) : Words();
}

}  // namespace

void AddCompletion(CLI::App* app, CompletionOptions* options) {
  CLI::App* const completion =
      app->add_subcommand("completion", "Print the completion file of a shell");
  completion->add_option("SHELL", options->shell, "Which one")
      ->type_name("bash|zsh|fish")
      ->required()
      ->check(CLI::IsMember({"bash", "zsh", "fish"}).description(""));
  completion->footer(
      "bash: loka completion bash > ~/.local/share/bash-completion/completions/loka\n"
      "zsh:  loka completion zsh > _loka, in a folder of $fpath\n"
      "fish: loka completion fish > ~/.config/fish/completions/loka.fish\n"
      "Example: loka completion bash");
}

int RunCompletion(const CompletionOptions& options) {
  const CommandTree tree;
  const CommandModel root = ModelOf(tree.App());
  const std::string text = options.shell == "bash"  ? BashCompletion(root)
                           : options.shell == "zsh" ? ZshCompletion(root)
                                                    : FishCompletion(root);
  return static_cast<int>(WriteResult(text) ? ExitStatus::kDone : ExitStatus::kRefused);
}

void AddManualPage(CLI::App* app, ManualPageOptions* options) {
  CLI::App* const page = app->add_subcommand("manual-page", "");
  page->add_option("FILE", options->file)->required()->check(CLI::ExistingFile);
}

int RunManualPage(const ManualPageOptions& options) {
  std::ifstream file(options.file);
  const std::string page((std::istreambuf_iterator<char>(file)), std::istreambuf_iterator<char>());
  const CommandTree tree;
  std::string filled;
  std::string error;
  if (!FillManualPage(page, ModelOf(tree.App()), &filled, &error)) {
    TellUser(options.file + ": " + error);
    return static_cast<int>(ExitStatus::kUsage);
  }
  return static_cast<int>(WriteResult(filled) ? ExitStatus::kDone : ExitStatus::kRefused);
}

void AddWords(CLI::App* app, WordsOptions* options) {
  CLI::App* const words = app->add_subcommand("words", "");
  words->add_option("KIND", options->kind)->required();
  words->add_option("--plugin", options->pluginFile);
}

int RunWords(const WordsOptions& options) {
  std::string text;
  for (const std::string& word : WordsOf(options)) {
    text += word.empty() ? "" : PrintableUtf8(word) + "\n";
  }
  return static_cast<int>(WriteResult(text) ? ExitStatus::kDone : ExitStatus::kRefused);
}
