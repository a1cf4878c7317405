// SPDX-License-Identifier: Apache-2.0
#include "host/commands/ConfigCommand.h"

#include <CLI/CLI.hpp>
#include <array>
#include <cstdio>

#include "host/base/ExitStatus.h"
#include "host/commands/CommandFailure.h"
#include "host/commands/ProfileFile.h"
#include "host/commands/ProfileUse.h"
#include "host/document/DescriptionBlock.h"
#include "host/document/DescriptionDocument.h"
#include "host/framing/ConfigEdit.h"
#include "host/framing/ConfigReport.h"
#include "host/framing/DocumentDifferences.h"
#include "host/runtime/HostSession.h"
#include "host/text/ByteText.h"
#include "host/text/Output.h"
#include "interfaces/IProtocol.h"
#include "interfaces/IProtocol5.h"

namespace {

void AddInput(CLI::App* command, ConfigOptions* options, ConfigOptions::Action action) {
  command
      ->add_option("CONFIG", options->configurationWord, "Configuration: text, FILE or - (stdin)")
      ->type_name("")
      ->required();
  command->callback([options, action] { options->action = action; });
}

// The driver's own list of what it took, empty when it does not tell.
std::string ComParams(IProtocol* protocol) {
  const auto* const protocol5 = static_cast<const IProtocol5*>(protocol->ConvertTo("IProtocol5"));
  std::array<char, 512> text{};
  if (protocol5 == nullptr ||
      protocol5->vcsGetComParams(text.data(), static_cast<int>(text.size()) - 1) == 0) {
    return {};
  }
  return text.data();
}

// What the loaded driver says of itself and this program does not know.
void TellDocument(const IProtocol* protocol) {
  DescriptionBlock block;
  DescriptionDocument document;
  std::string error = "the driver has no description";
  const char* const lengthLine = protocol->GetXml();
  if (lengthLine == nullptr || !ReadDescriptionAt(lengthLine, &block, &error) ||
      !ParseDescription(block.xml, &document, &error)) {
    TellUser(error);
    return;
  }
  for (const std::string& difference : DocumentDifferences(document)) {
    TellUser(difference);
  }
}

int Check(const ConfigOptions& options, const std::string& configuration) {
  HostOptions host;
  host.pluginFile = options.pluginFile;
  HostSession session(host);
  HostResult result = session.Open();
  if (result.IsDone()) {
    result = session.Configure(configuration);
  }
  for (const std::string& note : ConfigNotes(configuration)) {
    TellUser(note);
  }
  if (!result.IsDone()) {
    return Fail(result.status, result.text);
  }
  TellDocument(session.Protocol());
  (void)std::printf("ok  %s\n", ConfigLine(configuration, ComParams(session.Protocol())).c_str());
  return static_cast<int>(ExitStatus::kDone);
}

int Show(const std::string& configuration) {
  for (const std::string& line : ConfigTable(configuration)) {
    (void)std::printf("%s\n", line.c_str());
  }
  for (const std::string& note : ConfigNotes(configuration)) {
    TellUser(note);
  }
  return static_cast<int>(ExitStatus::kDone);
}

int New(const ConfigOptions& options) {
  const std::string configuration = options.framing.Configuration();
  (void)std::printf("%s\n", configuration.c_str());
  TellUser(ConfigLine(configuration, ""));
  return static_cast<int>(ExitStatus::kDone);
}

// One line a profile. What is wrong with one is told, and the others are listed all the same.
int Profiles() {
  std::vector<Profile> profiles;
  std::string error;
  if (!ReadProfiles(ProfileFiles(), &profiles, &error)) {
    return Fail(ExitStatus::kUsage, error);
  }
  if (profiles.empty()) {
    std::string files;
    for (const std::string& file : ProfileFiles()) {
      files += (files.empty() ? "" : " and ") + file;
    }
    TellUser("no profiles; they stand in " + files + ", see loka-config(5)");
  }
  auto status = ExitStatus::kDone;
  for (const Profile& profile : profiles) {
    std::string line = profile.name + "  " + profile.file;
    for (const auto& [key, value] : profile.values) {
      line.append("  ").append(key).append("=").append(value);
    }
    (void)std::printf("%s\n", EscapeBytes(line).c_str());
    if (!CheckProfile(profile, &error)) {
      TellUser(error);
      status = ExitStatus::kUsage;
    }
  }
  return static_cast<int>(status);
}

}  // namespace

void AddConfig(CLI::App* app, ConfigOptions* options) {
  CLI::App* const config =
      app->add_subcommand("config", "Make, check or explain configurations, list profiles");
  config->require_subcommand(1);
  config->footer("Example: loka config new -b 9600 -d 7 -p even --rx-prefix STX --rx-suffix ETX");
  CLI::App* const make = config->add_subcommand("new", "Print a configuration made of flags");
  options->framing.AddAll(make);
  options->framing.AddConfiguring(make);
  make->callback([options] { options->action = ConfigOptions::Action::kNew; });
  make->footer("Example: loka config new -b 9600 -d 7 -p even --rx-prefix STX --rx-suffix ETX");
  CLI::App* const check = config->add_subcommand("check", "Let the driver judge a configuration");
  AddInput(check, options, ConfigOptions::Action::kCheck);
  check->add_option("--plugin", options->pluginFile, "Driver to ask")->type_name("FILE");
  check->footer("Example: loka config new -b 9600 --rx-suffix CR | loka config check -");
  CLI::App* const show = config->add_subcommand("show", "Explain a configuration key by key");
  AddInput(show, options, ConfigOptions::Action::kShow);
  show->footer("Example: loka config new -b 9600 --rx-suffix CR | loka config show -");
  CLI::App* const profiles = config->add_subcommand("profiles", "List and check the profiles");
  profiles->callback([options] { options->action = ConfigOptions::Action::kProfiles; });
  profiles->footer("Example: loka config profiles");
}

int RunConfig(const ConfigOptions& options) {
  (void)std::setvbuf(stdout, nullptr, _IOLBF, BUFSIZ);
  if (options.action == ConfigOptions::Action::kProfiles) {
    return Profiles();
  }
  if (options.action == ConfigOptions::Action::kNew) {
    return New(options);
  }
  std::string configuration;
  std::string error;
  if (!ReadConfiguration(options.configurationWord, &configuration, &error)) {
    return Fail(ExitStatus::kUsage, EscapeBytes(error));
  }
  return options.action == ConfigOptions::Action::kCheck ? Check(options, configuration)
                                                         : Show(configuration);
}
