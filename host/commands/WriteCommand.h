// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include "host/commands/InstanceAccess.h"

namespace CLI {
class App;
}

// `loka write`: the value of a tag.
struct WriteOptions {
  InstanceAccess access;
  std::string uri;
  std::string value;
  bool isHex = false;  // the value is given as bytes
  bool isJson = false;
};

void AddWrite(CLI::App* app, WriteOptions* options);

// Returns the exit status of the program.
int RunWrite(WriteOptions* options);
