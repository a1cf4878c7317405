// SPDX-License-Identifier: Apache-2.0
#include "host/framing/ConfigNumber.h"

#include <algorithm>
#include <cctype>
#include <cstddef>
#include <cstdlib>
#include <limits>

namespace {

int BaseOf(const std::string& text) {
  std::size_t at = text.find_first_not_of("+-");
  if (at == std::string::npos || text[at] != '0' || at + 1 >= text.size()) {
    return 10;
  }
  ++at;
  const bool isHex = (text[at] == 'x' || text[at] == 'X') && at + 1 < text.size() &&
                     std::isxdigit(static_cast<unsigned char>(text[at + 1])) != 0;
  if (isHex) {
    return 16;
  }
  return std::isdigit(static_cast<unsigned char>(text[at])) != 0 ? 8 : 10;
}

}  // namespace

ConfigNumber ParseConfigNumber(const std::string& text) {
  char* end = nullptr;
  const long long wide = std::strtoll(text.c_str(), &end, 0);
  ConfigNumber number;
  number.value = static_cast<int>(std::clamp<long long>(wide, std::numeric_limits<int>::min(),
                                                        std::numeric_limits<int>::max()));
  number.isNumber = end != text.c_str();
  number.hasRest = *end != '\0';
  number.base = BaseOf(text);
  return number;
}
