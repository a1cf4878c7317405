// SPDX-License-Identifier: Apache-2.0
#include "host/text/Output.h"

#include <cerrno>
#include <cstdio>
#include <cstring>

void TellUser(const std::string& text) { (void)std::fprintf(stderr, "loka: %s\n", text.c_str()); }

bool WriteResult(const std::string& text) {
  errno = 0;
  if (std::fwrite(text.data(), 1, text.size(), stdout) == text.size() && std::fflush(stdout) == 0) {
    return true;
  }
  TellUser(std::string("cannot write the result: ") + std::strerror(errno));
  return false;
}
