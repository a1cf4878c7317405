// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

// A process that has a device open.
struct PortHolder {
  int processId = 0;
  std::string command;  // its command line, escaped and cut after 60 characters
};

// Who holds the device behind `path`: the owner of the file lock on it (/proc/locks) where there is
// one, else every process that has the device open (/proc/<pid>/fd; without root rights only the
// caller's own processes can be seen). Empty when nobody is found. See proc(5). Host threads.
std::vector<PortHolder> FindPortHolders(const std::string& path);

// Whether the device is the controlling terminal of some process, as the terminal of a login is.
// See proc(5), field tty_nr of /proc/<pid>/stat. Host threads.
bool IsControllingTerminal(const std::string& path);
