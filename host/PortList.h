// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

// A serial port of this machine.
struct ListedPort {
  std::string path;   // the name that stays the same when plugged again, where there is one
  std::string alias;  // the plain device path when `path` is a by-id name, else empty
};

// The name under <deviceRoot>/serial/by-id of the device behind `path`; empty when it has none.
// Host threads and ports' own threads.
std::string StableNameOf(const std::string& path, const std::string& deviceRoot = "/dev");

// Whether a path is one of those that count adapters in the order in which they were plugged in:
// .../ttyUSB0, .../ttyACM0. Any thread.
bool HasChangingName(const std::string& path);

// The serial ports with hardware behind them, names under <deviceRoot>/serial/by-id first, then the
// others, each group in alphabetical order. The folders are parameters for the sake of tests; on a
// live system they are /sys/class/tty (see sysfs(5)) and /dev. Host threads.
std::vector<ListedPort> ListPorts(const std::string& classFolder = "/sys/class/tty",
                                  const std::string& deviceRoot = "/dev");
