// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

#include "host/port/PortHolder.h"

// A serial port of this machine. Texts that the system does not know are empty.
struct ListedPort {
  enum class State { kFree, kBusy, kNoRights };

  std::string path;          // the name that stays the same when plugged again, where there is one
  std::string alias;         // the plain device path when `path` is a by-id name, else empty
  std::string manufacturer;  // of a USB adapter, as it tells them
  std::string product;
  std::string serialNumber;
  std::string driver;  // of the kernel, "ftdi_sio"
  int latencyMs = -1;  // how long the adapter collects bytes; -1 when it does not tell
  State state = State::kFree;
  std::vector<PortHolder> holders;  // for kBusy; empty when they cannot be seen

  // The device path, whichever of the two it is.
  const std::string& Device() const { return alias.empty() ? path : alias; }
};

// The name under <deviceRoot>/serial/by-id of the device behind `path`; empty when it has none.
// Host threads and ports' own threads.
std::string StableNameOf(const std::string& path, const std::string& deviceRoot = "/dev");

// Whether a path is one of those that count adapters in the order in which they were plugged in:
// .../ttyUSB0, .../ttyACM0. Any thread.
bool HasChangingName(const std::string& path);

// The serial ports with hardware behind them, names under <deviceRoot>/serial/by-id first, then the
// others, each group in alphabetical order. Who holds a port is not looked for (see FindStates).
// The folders are parameters for the sake of tests; on a live system they are /sys/class/tty (see
// sysfs(5)) and /dev. Host threads.
std::vector<ListedPort> ListPorts(const std::string& classFolder = "/sys/class/tty",
                                  const std::string& deviceRoot = "/dev");

// Fills in for each port whether this user may open it and whether somebody holds it. A holder that
// belongs to another user is seen when it has locked the port. Host threads.
void FindStates(std::vector<ListedPort>* ports);
