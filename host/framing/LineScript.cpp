// SPDX-License-Identifier: Apache-2.0
#include "host/framing/LineScript.h"

#include <algorithm>
#include <cerrno>
#include <cstddef>
#include <cstring>
#include <fstream>
#include <iostream>
#include <limits>
#include <sstream>

#include "host/framing/ControlNames.h"
#include "host/text/ByteText.h"

namespace {

constexpr std::size_t kMaxFileBytes = 64UL * 1024UL * 1024UL;
constexpr std::size_t kChunkBytes = 64UL * 1024UL;
constexpr std::size_t kMaxDigits = 9;  // more milliseconds than that are no silence but a mistake

bool IsNumber(const std::string& text) {
  return !text.empty() && text.size() <= kMaxDigits &&
         std::all_of(text.begin(), text.end(), [](char c) { return c >= '0' && c <= '9'; });
}

bool ParseSilence(const std::string& word, LineScript* script, std::string* error) {
  std::string number = word.substr(1);
  if (number.size() > 2 && number.substr(number.size() - 2) == "ms") {
    number.resize(number.size() - 2);
  }
  if (number.empty()) {
    script->push_back({});
    return true;
  }
  if (!IsNumber(number) || std::stoi(number) == 0) {
    *error = "\"" + EscapeBytes(word) + "\" is no silence; write ~ or ~500 (milliseconds)";
    return false;
  }
  script->push_back({"", std::stoi(number)});
  return true;
}

bool ReadAll(std::istream* stream, std::string* bytes) {
  std::string chunk(kChunkBytes, '\0');
  while (*stream && bytes->size() <= kMaxFileBytes) {
    (void)stream->read(chunk.data(), static_cast<std::streamsize>(chunk.size()));
    bytes->append(chunk, 0, static_cast<std::size_t>(stream->gcount()));
  }
  return bytes->size() <= kMaxFileBytes;
}

bool ReadFile(const std::string& name, std::string* bytes, std::string* error) {
  bool isShort = true;
  if (name == "-") {
    isShort = ReadAll(&std::cin, bytes);
  } else {
    std::ifstream file(name, std::ios::binary);
    if (!file) {
      *error = name + ": " + std::strerror(errno);
      return false;
    }
    errno = 0;
    isShort = ReadAll(&file, bytes);
    if (file.bad() || errno == EISDIR) {
      *error = name + ": " + std::strerror(errno);
      return false;
    }
  }
  if (!isShort) {
    *error = name + ": longer than " + std::to_string(kMaxFileBytes) + " bytes";
  }
  return isShort;
}

std::vector<std::string> WordsOf(const std::string& text) {
  std::vector<std::string> words;
  std::istringstream lines(text);
  for (std::string line; std::getline(lines, line);) {
    std::istringstream stream(line.substr(0, line.find('#')));
    for (std::string word; stream >> word;) {
      words.push_back(word);
    }
  }
  return words;
}

bool ReadScriptFile(const std::string& name, bool hasWords, LineScript* script,
                    std::string* error) {
  std::string bytes;
  if (!ReadFile(name, &bytes, error)) {
    return false;
  }
  if (hasWords) {
    return ParseLineWords(WordsOf(bytes), script, error);
  }
  script->clear();
  if (!bytes.empty()) {
    script->push_back({bytes, 0});
  }
  return true;
}

}  // namespace

bool ParseLineWords(const std::vector<std::string>& words, LineScript* script, std::string* error) {
  LineScript result;
  for (const std::string& word : words) {
    if (!word.empty() && word.front() == '~') {
      if (!ParseSilence(word, &result, error)) {
        return false;
      }
      continue;
    }
    std::string bytes;
    if (!ParseControlText(word, &bytes, error)) {
      return false;
    }
    if (bytes.empty()) {
      continue;
    }
    if (result.empty() || result.back().bytes.empty()) {
      result.push_back({});
    }
    result.back().bytes += bytes;
  }
  *script = std::move(result);
  return true;
}

bool ReadLineScript(const std::vector<std::string>& words, bool hasWords, LineScript* script,
                    std::string* error) {
  const bool isFile = words.size() == 1 && (hasWords || words.front() == "-");
  if (!isFile && ParseLineWords(words, script, error)) {
    return true;
  }
  if (words.size() != 1) {
    return false;
  }
  const std::string wordError = *error;
  if (ReadScriptFile(words.front(), hasWords, script, error)) {
    return true;
  }
  if (!isFile) {
    *error = wordError + ", nor a file that can be read (" + *error + ")";
  }
  return false;
}
