// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <string_view>

// Colours on standard output or another file: "always", "never" or, as "auto", on a terminal unless
// NO_COLOR is set to a value. Any thread.
class TextStyle {
 public:
  static constexpr int kStandardOutput = 1;
  static constexpr int kStandardError = 2;

  explicit TextStyle(std::string_view choice, int fileDescriptor = kStandardOutput);

  std::string Dim(const std::string& text) const { return Wrap("2", text); }
  std::string Red(const std::string& text) const { return Wrap("31", text); }
  std::string Cyan(const std::string& text) const { return Wrap("36", text); }
  std::string Bold(const std::string& text) const { return Wrap("1", text); }

 private:
  std::string Wrap(const char* code, const std::string& text) const;

  bool isOn_ = false;
};
