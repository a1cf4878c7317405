// SPDX-License-Identifier: Apache-2.0
#include "host/commands/ProfileUse.h"

#include <CLI/CLI.hpp>
#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <map>
#include <set>

#include "host/commands/InstanceAccess.h"
#include "host/framing/ConfigKeyTable.h"
#include "host/text/ByteText.h"
#include "host/text/Output.h"

namespace {

// The option of a key of the configuration, or of an option's own name.
std::string OptionName(const std::string& key) {
  static const std::map<std::string, std::string> kOthers = {{"baudrate", "--baud"},
                                                             {"bits", "--data-bits"},
                                                             {"stopbits", "--stop-bits"},
                                                             {"hex_tokens", "--hex"},
                                                             {"token_queue_size", "--queue"}};
  const auto other = kOthers.find(key);
  std::string name = other == kOthers.end() ? "--" + key : other->second;
  std::replace(name.begin(), name.end(), '_', '-');
  return name;
}

// Keys that only a configuration has; "port" is the port word in a profile.
bool IsOnlyInConfiguration(const std::string& key) {
  return key == "CfgVer" || key == "model" || key == "autoConnect";
}

using Names = std::set<std::string>;

Names NamesOf(const CLI::App& command) {
  Names names;
  for (const CLI::Option* const option : command.get_options()) {
    names.insert(option->get_name());
  }
  names.erase("--help");
  names.erase("--profile");
  return names;
}

// The options that a profile can have: those of every command that runs a driver.
const Names& NamesOfAccess() {
  static const Names kNames = [] {
    CLI::App command;
    InstanceAccess access;
    AddInstanceAccess(&command, &access, false);
    return NamesOf(command);
  }();
  return kNames;
}

// Those among them that a configuration has as well.
const Names& NamesOfLine() {
  static const Names kNames = [] {
    CLI::App command;
    FramingFlags framing;
    framing.AddAll(&command);
    return NamesOf(command);
  }();
  return kNames;
}

// Gives the values of one profile to the options of a command.
class ProfileGiver {
 public:
  ProfileGiver(CLI::App* command, InstanceAccess* access) : command_(command), access_(access) {
    for (CLI::Option* const option : command_->get_options({})) {
      if (option->count() > 0) {
        fromCommandLine_.insert(option);
      }
    }
    hasPort_ = !access->portWord.empty() || IsGiven("--port");
    hasConfiguration_ = IsGiven("--config");
  }

  bool Give(const Profile& profile, std::string* error) {
    for (const auto& [key, value] : profile.values) {
      std::string reason;
      if (!GiveOne(key, value, &reason)) {
        *error = profile.file + ": [" + profile.name + "] " + EscapeBytes(key) + ": " + reason;
        return false;
      }
    }
    return true;
  }

 private:
  bool IsGiven(const std::string& name) const {
    return fromCommandLine_.contains(command_->get_option_no_throw(name));
  }

  bool GiveOne(const std::string& key, const std::string& value, std::string* reason) {
    if (IsOnlyInConfiguration(key)) {
      return hasConfiguration_ || access_->framing.Preset(key, value, reason);
    }
    CLI::Option* const option = command_->get_option_no_throw(OptionName(key));
    if (option == nullptr || !NamesOfAccess().contains(option->get_name())) {
      *reason = "no such key; loka-config(5) lists them";
      return false;
    }
    const bool isOfLine = NamesOfLine().contains(option->get_name());
    if (fromCommandLine_.contains(option) || (hasPort_ && key == "port") ||
        (hasConfiguration_ && isOfLine)) {
      return true;
    }
    for (CLI::Option* const excluded : option->get_excludes()) {
      if (fromCommandLine_.contains(excluded)) {
        return true;
      }
      if (excluded->count() > 0) {
        *reason = "contradicts " + excluded->get_name();
        return false;
      }
    }
    return Set(option, value, reason);
  }

  static bool Set(CLI::Option* option, const std::string& value, std::string* reason) {
    // A flag that is off is one that is not given, except where that overrules the configuration.
    if (option->get_items_expected_max() == 0 && value == "false" &&
        option->get_name() != "--hex") {
      return true;
    }
    try {
      option->add_result(value);
      option->run_callback();
      return true;
    } catch (const CLI::Error& error) {
      *reason = error.what();
      return false;
    }
  }

  CLI::App* const command_;
  InstanceAccess* const access_;
  std::set<const CLI::Option*> fromCommandLine_;
  bool hasPort_ = false;
  bool hasConfiguration_ = false;
};

bool LooksLikeName(const std::string& word) {
  return !word.empty() && word.find_first_of("/=,:") == std::string::npos;
}

// The name of the wanted profile, which is taken out of PORT when it stands there.
bool FindName(const std::vector<Profile>& profiles, InstanceAccess* access, std::string* name,
              std::string* error) {
  *name = access->profile;
  std::error_code ignored;
  if (name->empty() && LooksLikeName(access->portWord)) {
    if (FindProfile(profiles, access->portWord) != nullptr) {
      name->swap(access->portWord);
    } else if (!std::filesystem::exists(access->portWord, ignored)) {
      *error = "'" + EscapeBytes(access->portWord) + "' is neither a port nor a profile; ";
    }
  } else if (!name->empty() && FindProfile(profiles, *name) == nullptr) {
    *error = "there is no profile '" + EscapeBytes(*name) + "'; ";
  }
  if (!error->empty()) {
    *error += profiles.empty() ? "there are no profiles, see loka config profiles"
                               : "profiles: " + ProfileNames(profiles);
  }
  return error->empty();
}

void UseEnvironment(InstanceAccess* access) {
  const char* const word = std::getenv("LOKA_PORT");
  if (word != nullptr && word[0] != '\0' && access->portWord.empty() &&
      access->options.portWords.empty()) {
    access->options.portWords.emplace_back(word);
  }
}

}  // namespace

bool UseProfile(InstanceAccess* access, std::string* error) {
  error->clear();
  if (!access->profile.empty() || LooksLikeName(access->portWord)) {
    std::vector<Profile> profiles;
    std::string name;
    if (!ReadProfiles(ProfileFiles(), &profiles, error) ||
        !FindName(profiles, access, &name, error)) {
      return false;
    }
    const Profile* const profile = FindProfile(profiles, name);
    if (profile != nullptr) {
      if (!ProfileGiver(access->command, access).Give(*profile, error)) {
        return false;
      }
      if (!access->isQuiet) {
        TellUser("profile " + name + " of " + profile->file);
      }
    }
  }
  UseEnvironment(access);
  return true;
}

bool CheckProfile(const Profile& profile, std::string* error) {
  CLI::App command;
  InstanceAccess access;
  AddInstanceAccess(&command, &access);
  return ProfileGiver(&command, &access).Give(profile, error);
}
