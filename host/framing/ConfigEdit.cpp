// SPDX-License-Identifier: Apache-2.0
#include "host/framing/ConfigEdit.h"

#include <algorithm>
#include <cerrno>
#include <cstddef>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <sstream>
#include <system_error>

#include "host/framing/ConfigText.h"

namespace {

constexpr const char* kMarker = "CfgVer=1";
constexpr const char* kNextMarker = "CfgVer=";
constexpr std::size_t kMaxBytes = 1024UL * 1024UL;

// Where the section stands in the text; from npos on when there is none.
struct Range {
  std::size_t begin = std::string::npos;
  std::size_t end = std::string::npos;
};

Range SectionOf(const std::string& text) {
  const std::size_t marker = text.find(kMarker);
  if (marker == std::string::npos) {
    return {};
  }
  const std::size_t begin = marker + std::strlen(kMarker);
  const std::size_t next = text.find(kNextMarker, begin);
  return {begin, next == std::string::npos ? text.size() : next};
}

// Behind the "=" of the key that counts, npos when the section has none.
std::size_t FindValue(const std::string& text, Range section, const std::string& key) {
  const std::string wanted = key + "=";
  for (std::size_t at = text.find(wanted, section.begin);
       at != std::string::npos && at + wanted.size() <= section.end;
       at = text.find(wanted, at + 1)) {
    if (at == section.begin || std::strchr(kConfigWhiteSpace, text[at - 1]) != nullptr) {
      return at + wanted.size();
    }
  }
  return std::string::npos;
}

std::vector<std::string> WordsOf(const std::string& configuration) {
  const Range section = SectionOf(configuration);
  if (section.begin == std::string::npos) {
    return {};
  }
  std::istringstream stream(configuration.substr(section.begin, section.end - section.begin));
  std::vector<std::string> words;
  for (std::string word; stream >> word;) {
    words.push_back(word);
  }
  return words;
}

// False when more than the limit comes.
bool ReadAll(std::istream* stream, std::string* text) {
  text->resize(kMaxBytes + 1);
  (void)stream->read(text->data(), static_cast<std::streamsize>(text->size()));
  text->resize(static_cast<std::size_t>(stream->gcount()));
  return text->size() <= kMaxBytes;
}

bool ReadWord(const std::string& word, std::string* text, std::string* error) {
  bool isShort = true;
  if (word == "-") {
    isShort = ReadAll(&std::cin, text);
  } else if (word.find_first_of("= \t\n") != std::string::npos) {
    *text = word;
  } else if (std::error_code code; std::filesystem::is_character_file(word, code)) {
    *error = word + ": a device, not a configuration; give the text, a file of it, or -";
    return false;
  } else {
    std::ifstream file(word, std::ios::binary);
    if (file) {
      isShort = ReadAll(&file, text);
    }
    if (!file.is_open() || file.bad()) {
      *error = word + ": " + std::strerror(errno);
      return false;
    }
  }
  if (!isShort) {
    *error = word + ": longer than any configuration";
  }
  return isShort;
}

}  // namespace

std::string WithConfigValue(const std::string& configuration, const std::string& key,
                            const std::string& value) {
  std::string text = configuration;
  Range section = SectionOf(text);
  if (section.begin == std::string::npos) {
    text += (text.empty() ? "" : " ") + std::string(kMarker);
    section = {text.size(), text.size()};
  }
  const std::size_t at = FindValue(text, section, key);
  if (at != std::string::npos) {
    const std::size_t end = std::min(text.find_first_of(kConfigWhiteSpace, at), section.end);
    return text.replace(at, end - at, value);
  }
  const bool isLast = section.end == text.size();
  std::size_t end = section.end;
  while (end > section.begin && std::strchr(kConfigWhiteSpace, text[end - 1]) != nullptr) {
    --end;
  }
  return text.replace(end, section.end - end, " " + key + "=" + value + (isLast ? "" : " "));
}

std::vector<std::pair<std::string, std::string>> ConfigPairs(const std::string& configuration) {
  std::vector<std::pair<std::string, std::string>> pairs;
  for (const std::string& word : WordsOf(configuration)) {
    const std::size_t equals = word.find('=');
    if (equals != std::string::npos) {
      pairs.emplace_back(word.substr(0, equals), word.substr(equals + 1));
    }
  }
  return pairs;
}

std::vector<std::string> ConfigStrayWords(const std::string& configuration) {
  std::vector<std::string> strays;
  for (const std::string& word : WordsOf(configuration)) {
    if (word.find('=') == std::string::npos) {
      strays.push_back(word);
    }
  }
  return strays;
}

bool ReadConfiguration(const std::string& word, std::string* configuration, std::string* error) {
  std::string text;
  if (!ReadWord(word, &text, error)) {
    return false;
  }
  if (text.find('\0') != std::string::npos) {
    *error = word + ": a zero byte is no part of a configuration";
    return false;
  }
  while (!text.empty() && (text.back() == '\n' || text.back() == '\r')) {
    text.pop_back();
  }
  *configuration = std::move(text);
  return true;
}
