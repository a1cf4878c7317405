// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "host/commands/InstanceAccess.h"

namespace CLI {
class App;
}

// `loka tags`: every memory type with its value.
struct TagsOptions {
  InstanceAccess access;
  bool isJson = false;
};

void AddTags(CLI::App* app, TagsOptions* options);

// Returns the exit status of the program. A tag that refuses is shown as such and is no failure.
int RunTags(TagsOptions* options);
