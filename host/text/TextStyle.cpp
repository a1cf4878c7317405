// SPDX-License-Identifier: Apache-2.0
#include "host/text/TextStyle.h"

#include <unistd.h>

#include <cstdlib>

namespace {

// As no-color.org asks: any value that is not empty.
bool IsColourUnwanted() {
  const char* const value = std::getenv("NO_COLOR");
  return value != nullptr && value[0] != '\0';
}

}  // namespace

TextStyle::TextStyle(std::string_view choice, int fileDescriptor)
    : isOn_(choice == "always" ||
            (choice != "never" && !IsColourUnwanted() && isatty(fileDescriptor) != 0)) {}

std::string TextStyle::Wrap(const char* code, const std::string& text) const {
  return isOn_ ? std::string("\x1B[") + code + "m" + text + "\x1B[0m" : text;
}
