// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

// A serial port of this machine.
struct ListedPort {
  std::string path;   // the name that stays the same when plugged again, where there is one
  std::string alias;  // the plain device path when `path` is a by-id name, else empty
};

// The serial ports with hardware behind them, names under <deviceRoot>/serial/by-id first, then the
// others, each group in alphabetical order. The folders are parameters for the sake of tests; on a
// live system they are /sys/class/tty (see sysfs(5)) and /dev. Host threads.
std::vector<ListedPort> ListPorts(const std::string& classFolder = "/sys/class/tty",
                                  const std::string& deviceRoot = "/dev");
