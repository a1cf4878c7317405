// SPDX-License-Identifier: Apache-2.0
#include "tests/abi/IncludeRules.h"

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <regex>
#include <set>
#include <sstream>

namespace {

// Headers that the build writes; they stand in no folder of the tree.
const std::map<std::string, std::string>& GeneratedHeaders() {
  static const std::map<std::string, std::string> kGenerated = {
      {"driver/Xml_LOKA.cpp", "Xml_LOKA_stream.h"}};
  return kGenerated;
}

bool IsGeneratedFor(const std::string& file, const std::string& target) {
  const auto found = GeneratedHeaders().find(file);
  return found != GeneratedHeaders().end() && found->second == target;
}

// What files of a folder may include, as beginnings of paths from the top of the tree. The longest
// folder that matches a file counts.
const std::map<std::string, std::vector<std::string>>& AllowedFolders() {
  static const std::map<std::string, std::vector<std::string>> kAllowed = {
      {"interfaces/", {"interfaces/"}},
      {"protlib/", {"interfaces/", "protlib/"}},
      {"model/", {"interfaces/", "protlib/", "model/"}},
      {"driver/", {"interfaces/", "protlib/", "model/", "driver/"}},
      {"factory/", {"interfaces/", "protlib/", "model/", "factory/"}},
      {"factory/ProtocolFactory.cpp", {"interfaces/", "protlib/", "model/", "driver/", "factory/"}},
      {"host/", {"interfaces/", "host/"}},
      {"tests/support/", {"interfaces/", "tests/support/"}},
      {"tests/plugin/", {"interfaces/", "tests/support/", "tests/plugin/"}},
      {"tests/panel/", {"interfaces/", "tests/support/", "tests/plugin/", "tests/panel/"}},
      {"tests/abi/", {"interfaces/", "tests/support/", "tests/abi/"}},
      {"tests/host/", {"interfaces/", "host/", "tests/support/", "tests/host/"}}};
  return kAllowed;
}

bool StartsWith(const std::string& text, const std::string& start) {
  return text.compare(0, start.size(), start) == 0;
}

const std::vector<std::string>* AllowedFor(const std::string& file) {
  const std::vector<std::string>* allowed = nullptr;
  std::size_t longest = 0;
  for (const auto& [folder, targets] : AllowedFolders()) {
    if (StartsWith(file, folder) && folder.size() > longest) {
      longest = folder.size();
      allowed = &targets;
    }
  }
  return allowed;
}

// The driver's folders know the language's library only; one file reads the system's clock.
bool IsDriverFolder(const std::string& file) {
  static const std::vector<std::string> kFolders = {"interfaces/", "protlib/", "model/", "driver/",
                                                    "factory/"};
  return file != "protlib/SystemClock.cpp" &&
         std::any_of(kFolders.begin(), kFolders.end(),
                     [&](const std::string& folder) { return StartsWith(file, folder); });
}

// Headers of the language have no folder and no suffix: <vector>, <cstdint>.
bool IsLanguageHeader(const std::string& target) {
  return target.find_first_of("/.") == std::string::npos;
}

// The files that stand in a cycle are reported once, from the first of them.
void FindCycles(const FileIncludes& files, const std::string& file, std::vector<std::string>& path,
                std::set<std::string>& done, std::vector<std::string>& broken) {
  const auto found = std::find(path.begin(), path.end(), file);
  if (found != path.end()) {
    std::string cycle = "cycle:";
    for (auto step = found; step != path.end(); ++step) cycle += " " + *step;
    broken.push_back(cycle);
    return;
  }
  const auto entry = files.find(file);
  if (entry == files.end() || done.count(file) != 0) return;
  path.push_back(file);
  for (const Include& include : entry->second) {
    if (include.quoted) FindCycles(files, include.target, path, done, broken);
  }
  path.pop_back();
  done.insert(file);
}

}  // namespace

std::vector<Include> ParseIncludes(const std::string& text) {
  static const std::regex kLine(R"(^[ \t]*#[ \t]*include[ \t]*([<"])([^>"]+)[>"])");
  std::vector<Include> includes;
  std::istringstream lines(text);
  for (std::string line; std::getline(lines, line);) {
    std::smatch match;
    if (std::regex_search(line, match, kLine)) includes.push_back({match[2], match[1] == "\""});
  }
  return includes;
}

FileIncludes ReadTree(const std::string& sourceDir) {
  namespace fs = std::filesystem;
  FileIncludes files;
  std::set<std::string> folders;
  for (const auto& entry : AllowedFolders()) {
    if (entry.first.back() == '/') folders.insert(entry.first);
  }
  for (const std::string& folder : folders) {
    const fs::path root = fs::path(sourceDir) / folder;
    if (!fs::exists(root)) continue;
    for (const auto& file : fs::recursive_directory_iterator(root)) {
      const std::string suffix = file.path().extension().string();
      if (suffix != ".h" && suffix != ".cpp" && suffix != ".inc") continue;
      std::ifstream stream(file.path());
      const std::string text((std::istreambuf_iterator<char>(stream)), {});
      files[fs::relative(file.path(), sourceDir).generic_string()] = ParseIncludes(text);
    }
  }
  return files;
}

std::vector<std::string> BrokenRules(const FileIncludes& files) {
  std::vector<std::string> broken;
  for (const auto& [file, includes] : files) {
    const std::vector<std::string>* allowed = AllowedFor(file);
    if (allowed == nullptr) {
      broken.push_back(file + " stands in a folder without a rule");
      continue;
    }
    for (const Include& include : includes) {
      if (!include.quoted) {
        if (IsDriverFolder(file) && !IsLanguageHeader(include.target)) {
          broken.push_back(file + " includes <" + include.target + ">");
        }
        continue;
      }
      const bool isAllowed =
          IsGeneratedFor(file, include.target) ||
          std::any_of(allowed->begin(), allowed->end(), [&](const std::string& folder) {
            return StartsWith(include.target, folder);
          });
      if (!isAllowed) broken.push_back(file + " includes \"" + include.target + "\"");
    }
  }
  std::set<std::string> done;
  for (const auto& entry : files) {
    std::vector<std::string> path;
    FindCycles(files, entry.first, path, done, broken);
  }
  return broken;
}
