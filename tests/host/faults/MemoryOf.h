// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <fstream>
#include <string>

// The memory that a process has at this moment (VmRSS) or has ever had (VmHWM), in KiB; 0 when it
// is not there (proc(5)).
inline long MemoryKibOf(int processId, const std::string& which = "VmRSS") {
  std::ifstream status("/proc/" + std::to_string(processId) + "/status");
  for (std::string line; std::getline(status, line);) {
    if (line.rfind(which + ":", 0) == 0) {
      return std::stol(line.substr(which.size() + 1));
    }
  }
  return 0;
}
