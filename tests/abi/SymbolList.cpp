// SPDX-License-Identifier: Apache-2.0
#include "tests/abi/SymbolList.h"

#include <cstdio>
#include <memory>
#include <regex>

std::vector<std::string> RunCommand(const std::string& command) {
  std::vector<std::string> lines;
  FILE* const pipe = popen(command.c_str(), "r");
  if (pipe == nullptr) return lines;
  std::string line;
  for (int c = std::fgetc(pipe); c != EOF; c = std::fgetc(pipe)) {
    if (c != '\n') {
      line += static_cast<char>(c);
    } else {
      lines.push_back(line);
      line.clear();
    }
  }
  pclose(pipe);
  return lines;
}

std::vector<std::string> UnexpectedExports(const std::vector<std::string>& lines) {
  static const std::regex kDefined("^[0-9a-f]+ [A-Za-z] (.*)$");
  static const std::regex kExpected("^(GetInterfaceFactory|ProtUtilsN::.*)$");
  std::vector<std::string> unexpected;
  for (const std::string& line : lines) {
    std::smatch match;
    const bool isSymbol = std::regex_match(line, match, kDefined);
    if (!isSymbol || !std::regex_match(match[1].str(), kExpected)) unexpected.push_back(line);
  }
  return unexpected;
}

std::vector<std::string> UnexpectedImports(const std::vector<std::string>& lines) {
  static const std::regex kExpected("^ *([wv] .*|U .*@(GLIBC|GLIBCXX|CXXABI|GCC)_[0-9.]+)$");
  std::vector<std::string> unexpected;
  for (const std::string& line : lines) {
    if (!std::regex_match(line, kExpected)) unexpected.push_back(line);
  }
  return unexpected;
}
