// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <map>
#include <string>
#include <vector>

// What this program knows of the driver's keys and settings beyond the description, for the form
// and the schema that are made of both.
struct ParameterNotes {
  struct Note {
    std::string meaning;     // "bits a second"
    std::string also;        // what the driver takes beyond the description, for people
    std::string extraEntry;  // the same as one more entry of a list; empty when it is none
    std::string pattern;     // of a text, as a regular expression for the whole; empty for any
  };

  // A setting that can change while the driver runs.
  struct Setting {
    std::string name;
    std::string key;
    std::string tagUri;
    std::string values;
  };

  std::map<std::string, Note> byKey;
  std::vector<Setting> settings;

  const Note& Of(const std::string& key) const {
    static const Note kNothing;
    const auto found = byKey.find(key);
    return found == byKey.end() ? kNothing : found->second;
  }
};
