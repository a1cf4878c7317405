// SPDX-License-Identifier: Apache-2.0
#include "host/commands/ProfileFile.h"

#include <CLI/CLI.hpp>
#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <sstream>

#include "host/text/ByteText.h"

namespace {

namespace fs = std::filesystem;

constexpr const char* kSystemFile = "/etc/loka/config.toml";
constexpr std::uintmax_t kMaxFileBytes = std::uintmax_t{1024} * 1024;
// What a name may have, so that a command line can tell it from a path and a port word.
constexpr const char* kNameCharacters =
    "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789_-";

std::string FromEnvironment(const char* name) {
  const char* const value = std::getenv(name);
  return value == nullptr ? "" : value;
}

// Marks of the reader for the beginning and the end of a section.
bool IsMark(const CLI::ConfigItem& item) { return item.name == "++" || item.name == "--"; }

std::string SectionOf(const CLI::ConfigItem& item) {
  std::string name;
  for (const std::string& part : item.parents) {
    name += (name.empty() ? "" : ".") + part;
  }
  return name;
}

// The reader cuts at #, also between quotes, and leaves a lone quote in place.
bool HasLoneQuote(const std::string& value) {
  const auto isQuote = [](char c) { return c == '"' || c == '\''; };
  return !value.empty() && (isQuote(value.front()) || isQuote(value.back()));
}

std::string Trouble(const CLI::ConfigItem& item, const Profile& profile) {
  const bool isTwice = std::any_of(profile.values.begin(), profile.values.end(),
                                   [&](const auto& value) { return value.first == item.name; });
  if (isTwice) {
    return "is given twice";
  }
  if (item.inputs.size() != 1) {
    return "has several values; put one with a comma or a blank in it in quotes";
  }
  return HasLoneQuote(item.inputs.front()) ? "has a quote or a # in its value" : "";
}

Profile* SectionNamed(const std::string& name, const std::string& file,
                      std::vector<Profile>* sections) {
  const auto found = std::find_if(sections->begin(), sections->end(),
                                  [&](const Profile& profile) { return profile.name == name; });
  if (found != sections->end()) {
    return &*found;
  }
  sections->push_back({name, file, {}});
  return &sections->back();
}

bool ReadItem(const std::string& file, const CLI::ConfigItem& item, std::vector<Profile>* sections,
              std::string* error) {
  const std::string name = SectionOf(item);
  if (name.empty() && !IsMark(item)) {
    *error = file + ": " + EscapeBytes(item.name) +
             " stands in no section; a profile begins with its name, as in [scale]";
    return false;
  }
  if (name.find_first_not_of(kNameCharacters) != std::string::npos) {
    *error = file + ": [" + EscapeBytes(name) +
             "] is no name of a profile: letters, digits, _ and - make one";
    return false;
  }
  Profile* const profile = SectionNamed(name, file, sections);
  if (IsMark(item)) {
    return true;
  }
  const std::string trouble = Trouble(item, *profile);
  if (!trouble.empty()) {
    *error = file + ": [" + name + "] ";
    error->append(EscapeBytes(item.name)).append(" ").append(trouble);
    return false;
  }
  profile->values.emplace_back(item.name, item.inputs.front());
  return true;
}

bool ReadFile(const std::string& file, std::vector<Profile>* sections, std::string* error) {
  std::error_code code;
  if (!fs::exists(file, code)) {
    return true;
  }
  std::ifstream stream(file, std::ios::binary);
  if (!fs::is_regular_file(file, code) || fs::file_size(file, code) > kMaxFileBytes || !stream) {
    *error = file + " cannot be read";
    return false;
  }
  try {
    const std::vector<CLI::ConfigItem> items = CLI::ConfigTOML().from_config(stream);
    return std::all_of(items.begin(), items.end(), [&](const CLI::ConfigItem& item) {
      return ReadItem(file, item, sections, error);
    });
  } catch (const CLI::Error& failure) {
    *error = file + ": " + failure.what();
    return false;
  }
}

}  // namespace

std::vector<std::string> ProfileFiles() {
  std::vector<std::string> files;
  const std::string configHome = FromEnvironment("XDG_CONFIG_HOME");
  const std::string home = FromEnvironment("HOME");
  if (configHome.rfind('/', 0) == 0) {
    files.push_back(configHome + "/loka/config.toml");
  } else if (home.rfind('/', 0) == 0) {
    files.push_back(home + "/.config/loka/config.toml");
  }
  files.emplace_back(kSystemFile);
  return files;
}

bool ReadProfiles(const std::vector<std::string>& files, std::vector<Profile>* profiles,
                  std::string* error) {
  std::vector<Profile> all;
  for (const std::string& file : files) {
    std::vector<Profile> sections;
    if (!ReadFile(file, &sections, error)) {
      return false;
    }
    for (Profile& section : sections) {
      if (FindProfile(all, section.name) == nullptr) {
        all.push_back(std::move(section));
      }
    }
  }
  *profiles = std::move(all);
  return true;
}

const Profile* FindProfile(const std::vector<Profile>& profiles, const std::string& name) {
  const auto found = std::find_if(profiles.begin(), profiles.end(),
                                  [&](const Profile& profile) { return profile.name == name; });
  return found == profiles.end() ? nullptr : &*found;
}

std::string ProfileNames(const std::vector<Profile>& profiles) {
  std::string names;
  for (const Profile& profile : profiles) {
    names += (names.empty() ? "" : ", ") + profile.name;
  }
  return names;
}
