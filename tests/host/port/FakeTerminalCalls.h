// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <linux/serial.h>
#include <sys/ioctl.h>
#include <termios.h>

#include <cerrno>
#include <string>
#include <vector>

#include "host/port/TerminalCalls.h"

// A chip with modem lines, RS-485 control, error counters and a latency setting behind a
// pseudo-terminal. What is switched off answers as a pseudo-terminal does.
class FakeTerminalCalls final : public TerminalCalls {
 public:
  bool hasModemLines = true;
  bool hasRs485 = true;
  bool hasCounters = true;
  bool hasLatency = true;

  // What was asked, in order: "dtr+", "rts-", "drain", "flush", "rs485 on".
  mutable std::vector<std::string> asked;
  int modemBits = 0;  // what TIOCMGET tells
  mutable termios line{};
  mutable serial_icounter_struct counts{};
  mutable serial_struct serial{};
  mutable serial_rs485 rs485{};

  int Ioctl(int fileDescriptor, unsigned long request, void* argument) const override {
    switch (request) {
      case TIOCMBIS:
      case TIOCMBIC:
        return SetModemLines(*static_cast<const int*>(argument), request == TIOCMBIS ? "+" : "-");
      case TIOCMGET:
        return hasModemLines ? Give(modemBits, argument) : Fail();
      case TIOCGRS485:
        return hasRs485 ? Give(rs485, argument) : Fail();
      case TIOCSRS485:
        rs485 = *static_cast<const serial_rs485*>(argument);
        asked.emplace_back((rs485.flags & SER_RS485_ENABLED) != 0 ? "rs485 on" : "rs485 off");
        return 0;
      case TIOCGICOUNT:
        return hasCounters ? Give(counts, argument) : Fail();
      case TIOCGSERIAL:
        return hasLatency ? Give(serial, argument) : Fail();
      case TIOCSSERIAL:
        serial = *static_cast<const serial_struct*>(argument);
        return 0;
      default:
        return System().Ioctl(fileDescriptor, request, argument);
    }
  }
  int GetLine(int fileDescriptor, termios* current) const override {
    return System().GetLine(fileDescriptor, current);
  }
  int SetLine(int fileDescriptor, const termios& wanted) const override {
    line = wanted;
    return System().SetLine(fileDescriptor, wanted);
  }
  int Drain(int) const override {
    asked.emplace_back("drain");
    return 0;
  }
  int Flush(int fileDescriptor, int queue) const override {
    asked.emplace_back("flush");
    return System().Flush(fileDescriptor, queue);
  }

  bool IsLowLatency() const { return (serial.flags & static_cast<int>(ASYNC_LOW_LATENCY)) != 0; }

 private:
  static int Fail() {
    errno = ENOTTY;
    return -1;
  }
  template <typename Value>
  static int Give(const Value& value, void* argument) {
    *static_cast<Value*>(argument) = value;
    return 0;
  }
  int SetModemLines(int bits, const char* sign) const {
    if (!hasModemLines) {
      return Fail();
    }
    if ((bits & TIOCM_DTR) != 0) {
      asked.push_back(std::string("dtr") + sign);
    }
    if ((bits & TIOCM_RTS) != 0) {
      asked.push_back(std::string("rts") + sign);
    }
    return 0;
  }
};
