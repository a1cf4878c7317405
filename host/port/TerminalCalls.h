// SPDX-License-Identifier: Apache-2.0
#pragma once

struct termios;

// What the host asks the kernel about a terminal device, in one place, so that tests can put a line
// behind it that a pseudo-terminal cannot be. Results and errno as the functions of the C library
// give them. Any thread.
class TerminalCalls {
 public:
  virtual ~TerminalCalls() = default;

  // The kernel's own answers. Lives as long as the program.
  static const TerminalCalls& System();

  // ioctl(2) with a pointer as argument, or null for requests without one.
  virtual int Ioctl(int fileDescriptor, unsigned long request, void* argument) const = 0;

  // tcgetattr(3), and tcsetattr(3) with TCSANOW.
  virtual int GetLine(int fileDescriptor, termios* line) const = 0;
  virtual int SetLine(int fileDescriptor, const termios& line) const = 0;

  // tcdrain(3): waits until everything has left, the last stop bit included.
  virtual int Drain(int fileDescriptor) const = 0;

  // tcflush(3) with TCIOFLUSH, TCIFLUSH or TCOFLUSH.
  virtual int Flush(int fileDescriptor, int queue) const = 0;
};
