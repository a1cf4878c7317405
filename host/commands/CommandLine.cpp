// SPDX-License-Identifier: Apache-2.0
#include "host/commands/CommandLine.h"

#include <cstdio>
#include <exception>

#include "host/base/ExitStatus.h"
#include "host/commands/CommandTree.h"

int RunCommandLine(int argumentCount, const char* const* arguments) {
  try {
    CommandTree tree;
    int status = 0;
    if (!tree.Parse({arguments + (argumentCount > 0 ? 1 : 0), arguments + argumentCount},
                    &status)) {
      return status;
    }
    return tree.Run();
  } catch (const std::exception& error) {
    (void)std::fprintf(stderr, "loka: %s\n", error.what());
    return static_cast<int>(ExitStatus::kRefused);
  }
}
