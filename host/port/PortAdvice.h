// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

#include "host/port/PortProblem.h"

// What the user can do about a port problem, one line an entry: the group to join for missing
// rights, the process to end for a busy port, the ports that are there for an absent one. The first
// line says what is wrong. Host threads.
std::vector<std::string> AdviceFor(const PortProblem& problem);
