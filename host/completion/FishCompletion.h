// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

struct CommandModel;

// The file loka.fish for a completions folder of fish (3 or later): completes commands, options and
// their values, with their help. Asks for changing words as BashCompletion does. Any thread.
std::string FishCompletion(const CommandModel& root);
