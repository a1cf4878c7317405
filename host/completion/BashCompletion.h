// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

struct CommandModel;

// A file that bash (4.4 or later) sources: completes commands, options and their values. Needs no
// other package. What only this machine knows (ports, profiles, running instances) it asks for with
// the hidden command "words". Any thread.
std::string BashCompletion(const CommandModel& root);
