// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

#include "host/port/PortList.h"

// How listed ports are shown. What an adapter says of itself is escaped. All functions: any thread.

// One line a port: path, driver, state. With `isLong` one block of lines a port, the word for
// --port as the last of them.
std::vector<std::string> DescribePorts(const std::vector<ListedPort>& ports, bool isLong);

// One JSON object a port, without its line end. Keys: path, device, manufacturer, product, serial,
// driver, latency_ms, state ("free", "busy", "no-rights"), holders (pid, command), word. Those that
// are not known are left out.
std::vector<std::string> PortsAsJson(const std::vector<ListedPort>& ports);
