// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

#include "host/store/SqliteFile.h"

class HostSession;

// The settings a started driver runs with, in words, one line an entry. `portPath` is the path
// behind the configured port. A line is left out when the driver refuses to tell. Host threads.
std::vector<std::string> DescribeSettings(HostSession* session, const std::string& portName,
                                          const std::string& portPath);

// One line for each stored value that differs from what the configuration says and therefore wins
// over it, as in "stored override: baud 9600 instead of 115200". Any thread.
std::vector<std::string> DescribeOverrides(const std::string& configuration,
                                           const SqliteFile::Values& stored);
