// SPDX-License-Identifier: Apache-2.0
#pragma once

struct serial_rs485;
class TerminalCalls;

// Direction control of RS-485 lines by the kernel (TIOCGRS485 and TIOCSRS485, documented with the
// kernel under "serial-rs485").

// Fills in what the kernel needs for a mode code (SerialMode). RS-485 and RS-485P: the driver is
// switched on by RTS while sending and off afterwards, the receiver is off meanwhile, no extra
// delays. RS-232 and RS-422, which need no direction: everything off. Any thread.
void BuildRs485Settings(int mode, serial_rs485* settings);

enum class Rs485Outcome {
  kDone,          // the kernel has taken the settings, or nothing had to be changed
  kNotSupported,  // the port has no direction control (ENOTTY and the like)
  kFailed,        // any other error, in errno
};

// Sets the direction control of an open port. Many adapters turn around on their own and know no
// such request: that is kNotSupported, and for RS-232 and RS-422 kDone. Host threads.
Rs485Outcome ApplyRs485(const TerminalCalls& calls, int fileDescriptor, int mode);

// Whether a mode code (SerialMode) is one in which somebody has to switch the direction. Any
// thread.
bool NeedsDirection(int mode);
