// SPDX-License-Identifier: Apache-2.0
#include "host/port/ErrorName.h"

#include <cstring>

std::string ErrorName(int errorNumber) {
  if (errorNumber == 0) {
    return {};
  }
  const char* const name = strerrorname_np(errorNumber);
  return name == nullptr ? "error " + std::to_string(errorNumber) : name;
}
