// SPDX-License-Identifier: Apache-2.0
// Program for the panel: prints what the kernel has set for a serial port, as "9600 7O2".
#include <fcntl.h>
#include <termios.h>
#include <unistd.h>

#include <cstdio>

namespace {

struct Rate {
  speed_t code;
  int bitsPerSecond;
};

constexpr Rate kRates[] = {{B150, 150},     {B300, 300},     {B600, 600},      {B1200, 1200},
                           {B2400, 2400},   {B4800, 4800},   {B9600, 9600},    {B19200, 19200},
                           {B38400, 38400}, {B57600, 57600}, {B115200, 115200}};

int BitsPerSecond(speed_t code) {
  for (const Rate& rate : kRates) {
    if (rate.code == code) return rate.bitsPerSecond;
  }
  return -1;
}

char ParityLetter(tcflag_t flags) {
  if ((flags & PARENB) == 0) return 'N';
  const bool isOdd = (flags & PARODD) != 0;
  if ((flags & CMSPAR) != 0) return isOdd ? 'M' : 'S';
  return isOdd ? 'O' : 'E';
}

}  // namespace

int main(int argc, char** argv) {
  if (argc != 2) {
    std::fprintf(stderr, "usage: line_settings DEVICE\n");
    return 2;
  }
  const int device = open(argv[1], O_RDONLY | O_NOCTTY | O_NONBLOCK);
  termios settings = {};
  if (device < 0 || tcgetattr(device, &settings) != 0) {
    std::perror(argv[1]);
    return 1;
  }
  const tcflag_t flags = settings.c_cflag;
  std::printf("%d %d%c%d\n", BitsPerSecond(cfgetospeed(&settings)), (flags & CSIZE) == CS7 ? 7 : 8,
              ParityLetter(flags), (flags & CSTOPB) != 0 ? 2 : 1);
  close(device);
  return 0;
}
