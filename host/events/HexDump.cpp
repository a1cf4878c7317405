// SPDX-License-Identifier: Apache-2.0
#include "host/events/HexDump.h"

#include <algorithm>

#include "host/text/ByteText.h"
#include "host/text/TextStyle.h"

namespace {

std::string Characters(std::string_view bytes) {
  std::string text(bytes);
  std::replace_if(
      text.begin(), text.end(),
      [](char character) { return character < 0x20 || character >= 0x7F; }, '.');
  return text;
}

// Hexadecimal texts of parts, the empty ones left out, with a blank between two.
void Append(const std::string& part, std::string* text) {
  if (!part.empty()) {
    *text += (text->empty() ? "" : " ") + part;
  }
}

}  // namespace

std::string HexDump(std::string_view bytes) { return HexBytes(bytes) + "   " + Characters(bytes); }

std::string HexDump(std::string_view frame, std::size_t prefixBytes, std::size_t suffixBytes,
                    const TextStyle& style) {
  const std::string_view prefix = frame.substr(0, std::min(prefixBytes, frame.size()));
  const std::string_view rest = frame.substr(prefix.size());
  const std::string_view body = rest.substr(0, rest.size() - std::min(suffixBytes, rest.size()));
  const std::string_view suffix = rest.substr(body.size());
  const auto dim = [&style](const std::string& text) {
    return text.empty() ? text : style.Dim(text);
  };
  std::string text;
  Append(dim(HexBytes(prefix)), &text);
  Append(HexBytes(body), &text);
  Append(dim(HexBytes(suffix)), &text);
  return text + "   " + dim(Characters(prefix)) + Characters(body) + dim(Characters(suffix));
}
