// SPDX-License-Identifier: Apache-2.0
#include "bench/reader/RawLine.h"

#include <fcntl.h>
#include <termios.h>

#include <cstdio>
#include <cstdlib>

int OpenRawLine(const char* device) {
  const int line = open(device, O_RDWR | O_NOCTTY | O_CLOEXEC);
  termios settings{};
  if (line < 0 || tcgetattr(line, &settings) != 0) {
    std::perror(device);
    std::exit(5);
  }
  cfmakeraw(&settings);
  cfsetspeed(&settings, B115200);
  settings.c_cc[VMIN] = 1;
  settings.c_cc[VTIME] = 0;
  if (tcsetattr(line, TCSANOW, &settings) != 0) {
    std::perror(device);
    std::exit(5);
  }
  return line;
}
