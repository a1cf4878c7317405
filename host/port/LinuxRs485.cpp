// SPDX-License-Identifier: Apache-2.0
#include "host/port/LinuxRs485.h"

#include <linux/serial.h>
#include <sys/ioctl.h>

#include <cerrno>

#include "host/port/TerminalCalls.h"
#include "interfaces/ISerialPort.h"

namespace {

bool IsUnsupported(int errorNumber) {
  return errorNumber == ENOTTY || errorNumber == ENOSYS || errorNumber == EOPNOTSUPP;
}

}  // namespace

bool NeedsDirection(int mode) { return mode == kModeRs485 || mode == kModeRs485P; }

void BuildRs485Settings(int mode, serial_rs485* settings) {
  *settings = serial_rs485{};
  if (NeedsDirection(mode)) {
    settings->flags = SER_RS485_ENABLED | SER_RS485_RTS_ON_SEND;
  }
}

Rs485Outcome ApplyRs485(const TerminalCalls& calls, int fileDescriptor, int mode) {
  serial_rs485 current{};
  if (calls.Ioctl(fileDescriptor, TIOCGRS485, &current) != 0) {
    if (!NeedsDirection(mode)) {
      return Rs485Outcome::kDone;
    }
    return IsUnsupported(errno) ? Rs485Outcome::kNotSupported : Rs485Outcome::kFailed;
  }
  // A port that was never in RS-485 mode is not asked to leave it.
  if (!NeedsDirection(mode) && (current.flags & SER_RS485_ENABLED) == 0) {
    return Rs485Outcome::kDone;
  }
  serial_rs485 wanted{};
  BuildRs485Settings(mode, &wanted);
  if (calls.Ioctl(fileDescriptor, TIOCSRS485, &wanted) == 0) {
    return Rs485Outcome::kDone;
  }
  return IsUnsupported(errno) ? Rs485Outcome::kNotSupported : Rs485Outcome::kFailed;
}
