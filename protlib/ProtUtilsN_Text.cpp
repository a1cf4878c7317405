// SPDX-License-Identifier: Apache-2.0
#include <cctype>

#include "protlib/ProtUtilsN.h"

namespace ProtUtilsN {

bool GetConfigValue(const char* cfg, const char* name, std::string& out) {
  const std::string text = cfg;
  const std::string key = std::string(name) + "=";
  const std::size_t found = text.find(key);
  if (found == std::string::npos) {
    return false;
  }
  const std::size_t begin = found + key.size();
  std::size_t end = begin;
  while (end < text.size() && std::isalnum(static_cast<unsigned char>(text[end])) != 0) {
    ++end;
  }
  out = text.substr(begin, end - begin);
  return true;
}

void Trim(std::string& s) { s = GetTrim(s); }

std::string GetTrim(const std::string& s) {
  const char* const kBlanks = " \t";
  const std::size_t first = s.find_first_not_of(kBlanks);
  if (first == std::string::npos) {
    return {};
  }
  return s.substr(first, s.find_last_not_of(kBlanks) - first + 1);
}

void ParseSubstrings(const std::string& s, std::vector<std::string>& out, char separator) {
  std::size_t begin = 0;
  for (;;) {
    const std::size_t end = s.find(separator, begin);
    if (end == std::string::npos) {
      out.push_back(GetTrim(s.substr(begin)));
      return;
    }
    out.push_back(GetTrim(s.substr(begin, end - begin)));
    begin = end + 1;
  }
}

}  // namespace ProtUtilsN
