// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include "host/base/ExitStatus.h"
#include "host/text/Output.h"

// Tells the user why a command ends and gives the exit status of the program.
inline int Fail(ExitStatus status, const std::string& text) {
  TellUser(text);
  return static_cast<int>(status);
}
