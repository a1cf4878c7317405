// SPDX-License-Identifier: Apache-2.0
#include "host/commands/InstanceAccess.h"

#include <CLI/CLI.hpp>
#include <algorithm>
#include <filesystem>
#include <system_error>
#include <utility>
#include <vector>

#include "host/commands/ProfileUse.h"
#include "host/control/AttachedInstance.h"
#include "host/control/ControlPath.h"
#include "host/framing/ConfigEdit.h"
#include "host/instance/LocalInstance.h"
#include "host/text/Output.h"
#include "host/text/Utf8Text.h"

namespace {

// The names of running instances that a command may mean.
std::vector<std::string> Candidates(const InstanceAccess& access) {
  std::vector<std::string> names = ControlNames();
  const std::string portName =
      access.instanceName.empty() ? access.options.PortName() : access.instanceName;
  if (!portName.empty()) {
    names.erase(std::remove_if(names.begin(), names.end(),
                               [&](const std::string& name) { return name != portName; }),
                names.end());
  }
  return names;
}

// False, with the reason in `answer`, for port words that are not right.
bool ReadPortWords(const InstanceAccess& access, PortMap* ports, Answer* answer) {
  for (const std::string& word : access.options.portWords) {
    std::string error;
    if (!ports->Add(word, &error)) {
      *answer = Refusal(error.insert(0, "port " + word + ": "), ExitStatus::kUsage);
      return false;
    }
  }
  return true;
}

// The running instance has the port that the command line names; where that names none, any will
// do.
bool HasWantedPort(const PortMap& ports, const AttachedInstance& instance) {
  if (ports.IsEmpty()) {
    return true;
  }
  const std::string wanted = ports.PathFor(instance.Port());
  const std::string path = instance.Info().value("path", "");
  std::error_code error;
  return !wanted.empty() && (wanted == path || std::filesystem::equivalent(wanted, path, error));
}

std::string JoinNames(const std::vector<std::string>& words) {
  std::string text;
  for (const std::string& word : words) {
    text += (text.empty() ? "" : ", ") + word;
  }
  return text;
}

Answer NoInstance(const InstanceAccess& access) {
  std::string text = "no instance is running";
  if (!access.instanceName.empty()) {
    text = "no instance " + PrintableUtf8(access.instanceName) + " is running";
  } else if (!access.options.portWords.empty()) {
    text += " on this port";
  }
  Answer answer = Refusal(text, ExitStatus::kPort);
  const std::string running = JoinNames(ControlNames());
  answer.hints.emplace_back(running.empty() ? "loka run starts one" : "running: " + running);
  return answer;
}

void TellAttached(const InstanceAccess& access, const AttachedInstance& instance) {
  if (access.isQuiet) {
    return;
  }
  const nlohmann::json& info = instance.Info();
  TellUser("attached to the running instance " + instance.Port() + " (process " +
           std::to_string(info.value("pid", 0)) + ", " + info.value("path", "") + ")");
  if (access.acknowledges && !info.value("ack", true)) {
    TellUser(
        "it leaves tokens in the queue (--ack never): each is shown when it is the oldest one");
  }
  if (access.framing.IsGiven() || !access.configSource.empty()) {
    TellUser("its own configuration holds; that of the command line is left out");
  }
  const InstanceOptions& options = access.options;
  if (options.withoutStore || !options.storeFile.empty() || !options.ident.empty() ||
      !options.pluginFile.empty()) {
    TellUser("its own plug-in and store hold; those of the command line are left out");
  }
}

void AddPortAndStore(CLI::App* command, InstanceAccess* access) {
  constexpr const char* kGroup = "Port and driver";
  InstanceOptions& options = access->options;
  command->add_option("--port", options.portWords, "As PORT; may be given more than once")
      ->type_name("PORT")
      ->expected(1)
      ->take_all()
      ->group(kGroup);
  command->add_option("--profile", access->profile, "Section of the profiles file to take")
      ->type_name("NAME")
      ->group(kGroup);
  command
      ->add_option("-c,--config", access->configSource,
                   "Configuration: a file, - for standard input, or the text itself")
      ->type_name("CONFIG")
      ->group(kGroup);
  command
      ->add_flag("--no-reconnect", access->isFinalLoss,
                 "The loss of the line ends it, exit status 6")
      ->group(kGroup);
  CLI::Option* const store =
      command->add_option("--store", options.storeFile, "File with the stored settings")
          ->type_name("FILE")
          ->group(kGroup);
  command->add_flag("--no-store", options.withoutStore, "Neither use nor keep stored settings")
      ->excludes(store)
      ->group(kGroup);
  command->add_option("--ident", options.ident, "Whose stored settings (else the port name)")
      ->type_name("NAME")
      ->group(kGroup);
  command
      ->add_option("--plugin", options.pluginFile,
                   "Driver to load (else $LOKA_PLUGIN, else beside loka)")
      ->type_name("FILE")
      ->group(kGroup);
}

void AddAttaching(CLI::App* command, InstanceAccess* access) {
  constexpr const char* kGroup = "Running instance";
  command->add_option("--instance", access->instanceName, "Which one to attach to, by its port")
      ->type_name("NAME")
      ->group(kGroup);
  CLI::Option* const instance = command->get_option("--instance");
  CLI::Option* const attach =
      command->add_flag("--attach", access->isAttachWanted, "Only with a running instance")
          ->group(kGroup);
  command->add_flag("--no-attach", access->isAttachRefused, "Never with a running instance")
      ->excludes(attach)
      ->excludes(instance)
      ->group(kGroup);
}

}  // namespace

std::unique_ptr<Instance> AttachInstance(const InstanceAccess& access, Answer* answer) {
  PortMap ports;
  if (!ReadPortWords(access, &ports, answer)) {
    return nullptr;
  }
  std::vector<std::unique_ptr<AttachedInstance>> found;
  std::vector<std::string> foundNames;
  for (const std::string& name : Candidates(access)) {
    std::string error;
    auto instance = AttachedInstance::Connect(name, &error);
    if (instance != nullptr && HasWantedPort(ports, *instance)) {
      found.push_back(std::move(instance));
      foundNames.push_back(name);
    }
  }
  if (found.size() > 1) {
    *answer = Refusal(
        "several instances are running: " + JoinNames(foundNames) + "; say which with --instance",
        ExitStatus::kUsage);
    return nullptr;
  }
  if (found.empty()) {
    if (access.isAttachWanted || !access.instanceName.empty()) {
      *answer = NoInstance(access);
    }
    return nullptr;
  }
  if (access.watches) {
    *answer = found.front()->Subscribe();
    if (!answer->IsDone()) {
      return nullptr;
    }
  }
  TellAttached(access, *found.front());
  return std::move(found.front());
}

void AddColour(CLI::App* command, std::string* colour) {
  command->add_option("--color", *colour, "When to use colours")
      ->type_name("auto|always|never")
      ->check(CLI::IsMember({"auto", "always", "never"}).description(""));
}

void AddInstanceAccess(CLI::App* command, InstanceAccess* access, bool hasPortWord) {
  access->command = command;
  if (hasPortWord) {
    command
        ->add_option("PORT", access->portWord,
                     "Port to open: a path or comN=PATH[,OPTION...]; or a profile")
        ->type_name("");
  }
  CLI::Option* const quiet =
      command->add_flag("-q,--quiet", access->isQuiet, "Nothing beside results and refusals");
  command->add_flag("-v,--verbose", access->verbosity, "More on standard error; -vv: every byte")
      ->excludes(quiet);
  AddColour(command, &access->colour);
  AddPortAndStore(command, access);
  AddAttaching(command, access);
  const std::size_t before = command->get_options().size();
  access->framing.AddAll(command);
  const std::vector<CLI::Option*> options = command->get_options();
  for (std::size_t at = before; at < options.size(); ++at) {
    options[at]->group("Line and framing");
  }
}

// What the flags say, for the name of the port word.
std::string ConfigurationOf(const InstanceAccess& access) {
  PortMap ports;
  for (const std::string& word : access.options.portWords) {
    std::string ignored;  // whoever opens the ports says what is wrong with a word
    (void)ports.Add(word, &ignored);
  }
  const std::string name = ports.OnlyName();
  const std::string configuration = access.framing.Configuration();
  return name.empty() ? configuration : WithConfigValue(configuration, "port", name);
}

bool Resolve(InstanceAccess* access, Answer* answer) {
  InstanceOptions& options = access->options;
  std::string error;
  if (!UseProfile(access, &error)) {
    *answer = Refusal(error, ExitStatus::kUsage);
    return false;
  }
  if (!access->portWord.empty()) {
    options.portWords.push_back(access->portWord);
  }
  if (access->isFinalLoss) {
    for (std::string& word : options.portWords) {
      word += ",reconnect=off";
    }
  }
  if (!access->configSource.empty() &&
      !ReadConfiguration(access->configSource, &options.configuration, &error)) {
    *answer = Refusal(error, ExitStatus::kUsage);
    return false;
  }
  if (!options.configuration.empty()) {
    options.configuration = access->framing.Apply(options.configuration);
  } else if (access->framing.IsGiven() || !options.portWords.empty()) {
    options.configuration = ConfigurationOf(*access);
  }
  return true;
}

std::unique_ptr<Instance> OpenInstance(InstanceAccess* access, Answer* answer) {
  if (!Resolve(access, answer)) {
    return nullptr;
  }
  if (!access->isAttachRefused) {
    auto attached = AttachInstance(*access, answer);
    if (attached != nullptr || !answer->IsDone()) {
      return attached;
    }
  }
  return BeginInstance(*access, answer);
}

std::unique_ptr<LocalInstance> BeginInstance(const InstanceAccess& access, Answer* answer) {
  if (access.options.configuration.empty()) {
    *answer = Refusal("no configuration and no running instance", ExitStatus::kUsage);
    answer->hints.emplace_back(
        "give --config FILE or framing flags with a port, or start loka run");
    return nullptr;
  }
  auto instance =
      LocalInstance::Open({access.options, access.acknowledges, access.connects}, answer);
  if (instance != nullptr) {
    HostOptions host;
    std::string error;
    if (MakeHostOptions(access.options, &host, &error) && !access.isQuiet) {
      if (access.verbosity > 0) {
        TellFiles(*instance->Session(), host);
      }
      TellSettings(access.options, host, instance->Session());
    }
  }
  return instance;
}

std::vector<std::string> DescribeAnswer(const Answer& answer) {
  std::vector<std::string> lines;
  if (!answer.text.empty()) {
    const std::string number =
        answer.errorCode == 0 ? "" : "error " + std::to_string(answer.errorCode) + ": ";
    lines.push_back(number + PrintableUtf8(answer.text));
  }
  for (const std::string& hint : answer.hints) {
    if (answer.IsDone()) {
      lines.push_back(PrintableUtf8(hint));
    } else if (answer.errorCode != 0 && lines.size() == 1) {
      lines.back() += "   hint: " + PrintableUtf8(hint);
    } else {
      lines.push_back("hint: " + PrintableUtf8(hint));
    }
  }
  return lines;
}

int TellAnswer(const Answer& answer) {
  for (const std::string& line : DescribeAnswer(answer)) {
    TellUser(line);
  }
  return static_cast<int>(answer.status);
}

int EndOf(const Instance& instance, const Answer& answer) {
  const int status = TellAnswer(answer);
  return instance.StopSignal() == 0
             ? status
             : static_cast<int>(ExitStatus::kFirstSignal) + instance.StopSignal();
}
