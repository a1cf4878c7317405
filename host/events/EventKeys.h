// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

// The keys of the events in NDJSON, for the manual page. A test holds the table to EventJson.
struct EventKey {
  const char* name = nullptr;
  const char* meaning = nullptr;
  const char* example = nullptr;  // a JSON value
  bool isOptional = false;        // left out when there is nothing to say
};

struct EventKind {
  const char* name = nullptr;  // the value of "ev"
  const char* meaning = nullptr;
  std::vector<EventKey> keys;  // behind t, ev and port, in the order of a line
};

// All kinds, in the order in which they are documented. Any thread.
const std::vector<EventKind>& EventKinds();

// A line as the program writes it, made of the examples of one kind. Any thread.
std::string ExampleLine(const EventKind& kind);
