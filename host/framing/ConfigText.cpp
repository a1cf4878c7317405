// SPDX-License-Identifier: Apache-2.0
#include "host/framing/ConfigText.h"

namespace {

std::string Section(const std::string& configuration) {
  const std::string marker = "CfgVer=1";
  const std::size_t start = configuration.find(marker);
  if (start == std::string::npos) {
    return {};
  }
  const std::size_t begin = start + marker.size();
  const std::size_t end = configuration.find("CfgVer=", begin);
  return configuration.substr(begin, end == std::string::npos ? end : end - begin);
}

}  // namespace

std::string ConfigValue(const std::string& configuration, const std::string& key,
                        const std::string& fallback) {
  const std::string text = Section(configuration);
  const std::string wanted = key + "=";
  for (std::size_t at = text.find(wanted); at != std::string::npos;
       at = text.find(wanted, at + 1)) {
    if (at == 0 || std::string(kConfigWhiteSpace).find(text[at - 1]) != std::string::npos) {
      const std::size_t begin = at + wanted.size();
      const std::size_t end = text.find_first_of(kConfigWhiteSpace, begin);
      return text.substr(begin, end == std::string::npos ? end : end - begin);
    }
  }
  return fallback;
}
