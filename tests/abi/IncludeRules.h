// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <map>
#include <string>
#include <vector>

// Which file of the source tree may include what. A file is named by its path from the top of the
// tree, "driver/HexText.cpp"; its includes are what stands between the quotes or angle brackets.
struct Include {
  std::string target;
  bool quoted = false;
};
using FileIncludes = std::map<std::string, std::vector<Include>>;

// The include lines of a source text.
std::vector<Include> ParseIncludes(const std::string& text);

// The folders whose files the rules look at, with every source file in them.
FileIncludes ReadTree(const std::string& sourceDir);

// One line for each include that breaks a rule of the folders, and one for each cycle.
std::vector<std::string> BrokenRules(const FileIncludes& files);
