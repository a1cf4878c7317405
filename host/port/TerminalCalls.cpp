// SPDX-License-Identifier: Apache-2.0
#include "host/port/TerminalCalls.h"

#include <sys/ioctl.h>
#include <termios.h>

namespace {

class SystemCalls final : public TerminalCalls {
 public:
  int Ioctl(int fileDescriptor, unsigned long request, void* argument) const override {
    return ioctl(fileDescriptor, request, argument);
  }
  int GetLine(int fileDescriptor, termios* line) const override {
    return tcgetattr(fileDescriptor, line);
  }
  int SetLine(int fileDescriptor, const termios& line) const override {
    return tcsetattr(fileDescriptor, TCSANOW, &line);
  }
  int Drain(int fileDescriptor) const override { return tcdrain(fileDescriptor); }
  int Flush(int fileDescriptor, int queue) const override { return tcflush(fileDescriptor, queue); }
};

}  // namespace

const TerminalCalls& TerminalCalls::System() {
  static const SystemCalls kCalls;
  return kCalls;
}
