// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

inline bool Holds(const std::string& text, const std::string& part) {
  return text.find(part) != std::string::npos;
}
