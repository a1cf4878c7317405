// SPDX-License-Identifier: Apache-2.0
#include "host/commands/CommandLine.h"

#include <cerrno>
#include <csignal>
#include <cstdio>
#include <cstring>
#include <exception>
#include <iostream>

#include "host/base/ExitStatus.h"
#include "host/commands/CommandTree.h"
#include "host/text/Output.h"

namespace {

// A result that has not gone out makes no success; who reads has gone away is none of our business.
int StatusWithOutput(int status) {
  errno = 0;
  const bool isFlushed = std::fflush(stdout) == 0 && std::cout.flush().good();
  if ((isFlushed && std::ferror(stdout) == 0) || errno == EPIPE || status != 0) {
    return status;
  }
  if (errno != 0) {
    TellUser(std::string("cannot write the result: ") + std::strerror(errno));
  }
  return static_cast<int>(ExitStatus::kRefused);
}

}  // namespace

int RunCommandLine(int argumentCount, const char* const* arguments) {
  // A file that has reached the limit of its size is an error like any other, not the end.
  (void)std::signal(SIGXFSZ, SIG_IGN);
  try {
    CommandTree tree;
    int status = 0;
    if (!tree.Parse({arguments + (argumentCount > 0 ? 1 : 0), arguments + argumentCount},
                    &status)) {
      return StatusWithOutput(status);
    }
    return StatusWithOutput(tree.Run());
  } catch (const std::exception& error) {
    (void)std::fprintf(stderr, "loka: %s\n", error.what());
    return static_cast<int>(ExitStatus::kRefused);
  }
}
