// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

// A configuration for port com1 with what a test adds to it.
inline std::string TestConfiguration(const std::string& more) {
  return "CfgVer=1 model=1 port=com1 baudrate=115200 parity=none bits=8 stopbits=1 mode=RS-232 " +
         more;
}
