// SPDX-License-Identifier: Apache-2.0
#include "host/store/StorePath.h"

#include <cstdlib>

std::string DefaultStorePath() {
  const char* const stateHome = std::getenv("XDG_STATE_HOME");
  if (stateHome != nullptr && stateHome[0] == '/') {
    return std::string(stateHome) + "/loka/store.db";
  }
  const char* const home = std::getenv("HOME");
  if (home != nullptr && home[0] == '/') {
    return std::string(home) + "/.local/state/loka/store.db";
  }
  return {};
}
