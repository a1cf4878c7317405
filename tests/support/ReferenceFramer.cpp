// SPDX-License-Identifier: Apache-2.0
#include "tests/support/ReferenceFramer.h"

namespace {

bool EndsWith(const std::string& text, const std::string& tail) {
  return text.size() >= tail.size() && text.substr(text.size() - tail.size()) == tail;
}

// `text` without `front` characters in front and `back` at the end; empty where they overlap.
std::string Inner(const std::string& text, std::size_t front, std::size_t back) {
  return text.size() > front + back ? text.substr(front, text.size() - front - back) : "";
}

}  // namespace

std::vector<std::string> ReferenceTokens(const std::vector<int>& line, const std::string& prefix,
                                         const std::string& suffix) {
  std::vector<std::string> tokens;
  std::string held;  // as long as it is shorter than the prefix, the prefix is still being matched
  for (const int event : line) {
    if (event == kSilence) {
      // Silence ends a token only where no suffix has to, and only if there is something in it.
      if (suffix.empty() && held.size() > prefix.size()) {
        tokens.push_back(Inner(held, prefix.size(), 0));
      }
      held.clear();
      continue;
    }

    const char byte = static_cast<char>(event);
    if (held.size() < prefix.size()) {
      if (byte != prefix[held.size()]) held.clear();
      if (byte == prefix[held.size()]) held += byte;
      continue;
    }

    held += byte;
    if (!suffix.empty()) {
      if (held.size() >= prefix.size() + suffix.size() && EndsWith(held, suffix)) {
        tokens.push_back(Inner(held, prefix.size(), suffix.size()));
        held.clear();
      }
    } else if (!prefix.empty() && EndsWith(held, prefix)) {
      tokens.push_back(Inner(held, prefix.size(), prefix.size()));
      held = prefix;  // the next token has begun
    }
    if (held.size() > 1000) held.clear();
  }
  return tokens;
}
