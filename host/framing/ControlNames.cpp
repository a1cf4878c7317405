// SPDX-License-Identifier: Apache-2.0
#include "host/framing/ControlNames.h"

#include <algorithm>
#include <array>
#include <cctype>
#include <cstddef>

#include "host/framing/FramingSettings.h"
#include "host/text/ByteText.h"

namespace {

constexpr unsigned char kDelete = 0x7F;

// In the order of their codes, from 0. FF is shown, but not read: as text it is a number.
constexpr std::array<std::string_view, 32> kNames = {
    "NUL", "SOH", "STX", "ETX", "EOT", "ENQ", "ACK", "BEL", "BS",  "HT",  "LF",
    "VT",  "FF",  "CR",  "SO",  "SI",  "DLE", "DC1", "DC2", "DC3", "DC4", "NAK",
    "SYN", "ETB", "CAN", "EM",  "SUB", "ESC", "FS",  "GS",  "RS",  "US"};

struct Alias {
  std::string_view name;
  std::string_view bytes;
};

constexpr std::array<Alias, 7> kAliases = {{{"CRLF", "\r\n"},
                                            {"LFCR", "\n\r"},
                                            {"TAB", "\t"},
                                            {"XON", "\x11"},
                                            {"XOFF", "\x13"},
                                            {"DEL", "\x7F"},
                                            {"SPACE", " "}}};

std::string UpperCase(std::string_view text) {
  std::string result(text);
  std::transform(result.begin(), result.end(), result.begin(),
                 [](unsigned char c) { return static_cast<char>(std::toupper(c)); });
  return result;
}

bool FindName(const std::string& word, std::string* bytes) {
  const auto* const name = std::find(kNames.begin(), kNames.end(), word);
  if (name != kNames.end()) {
    *bytes += static_cast<char>(name - kNames.begin());
    return true;
  }
  const auto* const alias = std::find_if(kAliases.begin(), kAliases.end(),
                                         [&](const Alias& entry) { return entry.name == word; });
  if (alias == kAliases.end()) {
    return false;
  }
  *bytes += alias->bytes;
  return true;
}

// One word without separators.
bool AppendWord(std::string_view word, std::string* bytes) {
  std::string upper = UpperCase(word);
  if (upper.size() > 2 && upper.front() == '<' && upper.back() == '>') {
    upper = upper.substr(1, upper.size() - 2);
  }
  if (upper == "NONE") {
    return true;
  }
  if (upper.size() > 2 && upper[0] == '0' && upper[1] == 'X') {
    upper.erase(0, 2);
  }
  if (IsHexText(upper)) {
    *bytes += BytesOfHexText(upper);
    return true;
  }
  return FindName(upper, bytes);
}

}  // namespace

bool ParseControlText(std::string_view text, std::string* bytes, std::string* error) {
  constexpr std::string_view kSeparators = " ,+\t\r\n";
  std::string result;
  for (std::size_t at = text.find_first_not_of(kSeparators); at != std::string_view::npos;) {
    const std::size_t end = std::min(text.find_first_of(kSeparators, at), text.size());
    const std::string_view word = text.substr(at, end - at);
    if (!AppendWord(word, &result)) {
      *error = "\"" + EscapeBytes(word) +
               "\" is neither pairs of hexadecimal digits nor the name of a control byte (STX, "
               "ETX, CR, LF, CRLF, ... or none)";
      return false;
    }
    at = text.find_first_not_of(kSeparators, end);
  }
  *bytes = std::move(result);
  return true;
}

std::string_view ControlName(unsigned char byte) {
  if (byte == kDelete) {
    return "DEL";
  }
  return byte < kNames.size() ? kNames[byte] : std::string_view();
}
