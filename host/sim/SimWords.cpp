// SPDX-License-Identifier: Apache-2.0
#include "host/sim/SimWords.h"

#include <cmath>
#include <cstdint>
#include <locale>
#include <sstream>
#include <utility>

#include "host/text/ByteText.h"

namespace {

constexpr double kDayMs = 24.0 * 60 * 60 * 1000;
constexpr int kDefaultPauseMs = 20;
constexpr std::size_t kMaxPieces = 1000;
constexpr std::size_t kMaxBodyBytes = 1000000;

// Digits with at most one point, whatever the locale.
bool ParseDecimal(std::string_view word, double* value) {
  if (word.empty() || word.find_first_not_of("0123456789.") != std::string_view::npos ||
      word.front() == '.' || word.back() == '.') {
    return false;
  }
  std::istringstream stream{std::string(word)};
  stream.imbue(std::locale::classic());
  double result = 0;
  if (!(stream >> result) || !stream.eof()) {
    return false;
  }
  *value = result;
  return true;
}

bool ParseCount(std::string_view word, std::size_t most, std::size_t* count) {
  double value = 0;
  if (word.find('.') != std::string_view::npos || !ParseDecimal(word, &value) || value < 1 ||
      value > static_cast<double>(most)) {
    return false;
  }
  *count = static_cast<std::size_t>(value);
  return true;
}

bool RemoveEnd(std::string_view end, std::string_view* word) {
  if (word->size() < end.size() || word->substr(word->size() - end.size()) != end) {
    return false;
  }
  word->remove_suffix(end.size());
  return true;
}

// What stands in front of "@" and behind it.
std::pair<std::string_view, std::string_view> Halves(std::string_view word) {
  const std::size_t at = word.find('@');
  return at == std::string_view::npos ? std::pair(word, std::string_view())
                                      : std::pair(word.substr(0, at), word.substr(at + 1));
}

// Appends the byte that the escape at the front of `rest` means and removes the escape.
bool TakeEscape(std::string_view* rest, std::string* text) {
  constexpr std::string_view kLetters = "rnt0\\";
  constexpr std::string_view kBytes("\r\n\t\0\\", 5);
  if (rest->size() < 2) {
    return false;
  }
  const std::size_t letter = kLetters.find((*rest)[1]);
  if (letter != std::string_view::npos) {
    *text += kBytes[letter];
    rest->remove_prefix(2);
    return true;
  }
  constexpr std::size_t kHexEscapeChars = 4;
  std::string byte;
  if ((*rest)[1] != 'x' || rest->size() < kHexEscapeChars ||
      !ParseHexBytes(rest->substr(2, 2), &byte) || byte.size() != 1) {
    return false;
  }
  *text += byte;
  rest->remove_prefix(kHexEscapeChars);
  return true;
}

}  // namespace

bool ParseTimeMs(std::string_view word, int unitMs, int* timeMs) {
  constexpr int kMsPerSecond = 1000;
  double factor = unitMs;
  if (RemoveEnd("ms", &word)) {
    factor = 1;
  } else if (RemoveEnd("s", &word)) {
    factor = kMsPerSecond;
  }
  double value = 0;
  if (!ParseDecimal(word, &value) || value * factor > kDayMs) {
    return false;
  }
  *timeMs = static_cast<int>(std::lround(value * factor));
  return true;
}

bool ParsePercent(std::string_view word, double* percent) {
  constexpr double kAll = 100;
  (void)RemoveEnd("%", &word);
  double value = 0;
  if (!ParseDecimal(word, &value) || value > kAll) {
    return false;
  }
  *percent = value;
  return true;
}

bool ParseSplit(std::string_view word, FaultOptions* options) {
  const auto [first, second] = Halves(word);
  std::size_t pieces = 2;
  int pauseMs = kDefaultPauseMs;
  if (!first.empty() && first.back() == 's') {
    if (!second.empty() || !ParseTimeMs(first, 1, &pauseMs)) {
      return false;
    }
  } else if (!ParseCount(first, kMaxPieces, &pieces) ||
             (first.size() != word.size() && !ParseTimeMs(second, 1, &pauseMs))) {
    return false;
  }
  options->pieces = pieces;
  options->pauseMs = pauseMs;
  return true;
}

bool ParseTooLong(std::string_view word, FaultOptions* options) {
  const auto [first, second] = Halves(word);
  std::size_t lengthBytes = 0;
  double percent = 100;
  if (!ParseCount(first, kMaxBodyBytes, &lengthBytes) ||
      (first.size() != word.size() && !ParsePercent(second, &percent))) {
    return false;
  }
  options->tooLongBytes = lengthBytes;
  options->tooLongPercent = percent;
  return true;
}

bool ParseEscapedText(std::string_view word, std::string* text) {
  std::string result;
  while (!word.empty()) {
    if (word.front() != '\\') {
      result += word.front();
      word.remove_prefix(1);
    } else if (!TakeEscape(&word, &result)) {
      return false;
    }
  }
  *text = std::move(result);
  return true;
}
