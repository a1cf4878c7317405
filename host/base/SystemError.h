// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <system_error>

// What the system says about an error number of errno. Any thread.
inline std::string SystemErrorText(int errorNumber) {
  return std::generic_category().message(errorNumber);
}
