// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <sys/wait.h>
#include <unistd.h>

#include <cstdlib>
#include <string>

#include "tests/support/PluginLibrary.h"

// Runs programs without any special right: as this user when that is not root, as the user "nobody"
// otherwise, since no file is closed to root.
class OtherUser {
 public:
  static constexpr unsigned int kNobody = 65534;

  // True for root: what belongs to this process does not belong to those programs.
  static bool IsAnother() { return geteuid() == 0; }
  static unsigned int Id() { return IsAnother() ? kNobody : geteuid(); }

  // The command to put in front; empty when nothing has to change.
  static std::string Wrapper() {
    return IsAnother() ? "setpriv --reuid=65534 --regid=65534 --clear-groups" : "";
  }

  // The other user can run what this build has made, which a build folder may not allow.
  static bool CanRunLoka() {
    const std::string command = Wrapper() + " '" LOKA_PROGRAM_PATH "' describe --plugin '" +
                                PluginLibrary::DefaultPath() + "' >/dev/null 2>&1";
    const int status = std::system(command.c_str());
    return WIFEXITED(status) && WEXITSTATUS(status) == 0;
  }
};
