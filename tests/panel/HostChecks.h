// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <ostream>
#include <string>
#include <vector>

#include "tests/panel/HostSession.h"

// One step of a check: a console command and what must come for it ("true" or "false", a blank and
// the reply without line ends behind it), or one of these.
//   device HEX       the device sends these bytes
//   sent HEX         the device has got these bytes and no other
//   line             the answer is what the kernel has set for the port
//   silence          half a second in which nobody sends
//   until COMMAND    the console command, again and again until the answer comes
struct HostStep {
  std::string command;
  std::string answer;
};

// A host that is started with these keys in front of an ordinary configuration, so that they win.
struct HostCheck {
  std::string name;
  std::string keys;
  std::vector<HostStep> steps;
  std::string firstLine = "started";
};
inline void PrintTo(const HostCheck& check, std::ostream* stream) { *stream << check.name; }

// What the library must do in any host, whatever the line: line settings, framing, kinds of tags,
// console commands, settings at run time, connection, refused configurations.
std::vector<HostCheck> HostChecks();

// Plays a check; what was other than expected, empty when all was well.
std::string Problems(const HostCheck& check, HostSession& session);
