// SPDX-License-Identifier: Apache-2.0
#include "tests/docs/SourceText.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>
#include <regex>
#include <sstream>

#include "tests/docs/MarkdownText.h"

namespace {

// The file without comments, include lines and compile-time checks. A literal of these sources
// holds no "//".
std::string CodeOf(const std::string& path) {
  std::istringstream stream(ReadProjectFile(path));
  std::string code;
  for (std::string line; std::getline(stream, line);) {
    if (line.compare(0, 8, "#include") == 0) continue;
    code += line.substr(0, line.find("//")) + "\n";
  }
  static const std::regex kCheck(R"re(static_assert\([^"]*"[^"]*"\);)re");
  return std::regex_replace(code, kCheck, "");
}

std::string Unescaped(const std::string& text) {
  std::string plain;
  for (std::size_t i = 0; i < text.size(); ++i) {
    if (text[i] == '\\' && i + 1 < text.size()) {
      ++i;
      plain += text[i] == 'n' ? '\n' : text[i] == 't' ? '\t' : text[i] == '0' ? '\0' : text[i];
    } else {
      plain += text[i];
    }
  }
  return plain;
}

// One or more literals with nothing but white space between them.
const char* const kLiteral = R"re("(?:[^"\\\n]|\\.)*"(?:\s*"(?:[^"\\\n]|\\.)*")*)re";

std::string Joined(const std::string& literals) {
  static const std::regex kPiece(R"re("((?:[^"\\\n]|\\.)*)")re");
  std::string text;
  for (std::sregex_iterator at(literals.begin(), literals.end(), kPiece), end; at != end; ++at) {
    text += Unescaped((*at)[1]);
  }
  return text;
}

}  // namespace

std::vector<std::string> LiteralsOf(const std::string& path) {
  // A quote as a character is no literal's end.
  const std::string code = std::regex_replace(CodeOf(path), std::regex("'\\\\?\"'"), "0");
  const std::regex literal(kLiteral);
  std::vector<std::string> literals;
  for (std::sregex_iterator at(code.begin(), code.end(), literal), end; at != end; ++at) {
    literals.push_back(Joined(at->str()));
  }
  return literals;
}

std::map<std::string, std::string> ConstantsOf(const std::string& path) {
  const std::string code = CodeOf(path);
  const std::regex constant(std::string(R"((k\w+)\s*=\s*()") + kLiteral + ")");
  std::map<std::string, std::string> constants;
  for (std::sregex_iterator at(code.begin(), code.end(), constant), end; at != end; ++at) {
    constants[(*at)[1]] = Joined((*at)[2]);
  }
  return constants;
}

std::vector<std::string> DriverSources() {
  std::vector<std::string> sources;
  for (const char* folder : {"protlib", "model", "driver", "factory"}) {
    const std::string path = std::string(LOKA_SOURCE_DIR) + "/" + folder;
    for (const auto& entry : std::filesystem::directory_iterator(path)) {
      const std::string name = entry.path().filename().string();
      const std::string extension = entry.path().extension().string();
      if (extension == ".h" || extension == ".cpp") sources.push_back(folder + ("/" + name));
    }
  }
  std::sort(sources.begin(), sources.end());
  EXPECT_GT(sources.size(), 40U);
  return sources;
}
