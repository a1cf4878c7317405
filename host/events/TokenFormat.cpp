// SPDX-License-Identifier: Apache-2.0
#include "host/events/TokenFormat.h"

#include "host/events/EventJson.h"
#include "host/events/WallClock.h"
#include "host/text/ByteText.h"

namespace {

constexpr const char* kLetters = "tnlpxaPj";
constexpr const char* kExpected =
    "%t time, %n number, %l length, %p payload, %x hex, %a waiting, %P port, %j JSON or %%";

std::string Value(char letter, const HostEvent& event, const TokenReceived& token) {
  switch (letter) {
    case 't':
      return LocalTimeText(event.timeUs);
    case 'n':
      return std::to_string(token.number);
    case 'l':
      return std::to_string(token.lengthBytes);
    case 'p':
      return EscapeBytes(token.bytes);
    case 'x':
      return HexBytes(token.bytes);
    case 'a':
      return std::to_string(token.waiting);
    case 'P':
      return event.port;
    default:
      return ToJsonLine(event);
  }
}

char Unescaped(char letter) {
  switch (letter) {
    case 'n':
      return '\n';
    case 't':
      return '\t';
    default:
      return letter;
  }
}

}  // namespace

bool TokenFormat::Parse(const std::string& text, TokenFormat* format, std::string* error) {
  TokenFormat parsed;
  std::string plain;
  for (std::size_t i = 0; i < text.size(); ++i) {
    const bool isLast = i + 1 == text.size();
    if (text[i] == '\\' && !isLast) {
      plain += Unescaped(text[++i]);
    } else if (text[i] != '%') {
      plain += text[i];
    } else if (!isLast && text[i + 1] == '%') {
      plain += text[++i];
    } else if (!isLast && std::string(kLetters).find(text[i + 1]) != std::string::npos) {
      parsed.pieces_.push_back({0, plain});
      plain.clear();
      parsed.pieces_.push_back({text[++i], ""});
    } else {
      *error = std::string("expected ") + kExpected;
      return false;
    }
  }
  parsed.pieces_.push_back({0, plain});
  *format = parsed;
  return true;
}

std::string TokenFormat::Write(const HostEvent& event) const {
  const auto& token = std::get<TokenReceived>(event.detail);
  std::string text;
  for (const Piece& piece : pieces_) {
    text += piece.letter == 0 ? piece.text : Value(piece.letter, event, token);
  }
  return text;
}
