// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

struct CommandModel;

// The file _loka for a folder in zsh's fpath: completes commands, options and their values, with
// their help. Asks for changing words as BashCompletion does. Any thread.
std::string ZshCompletion(const CommandModel& root);
