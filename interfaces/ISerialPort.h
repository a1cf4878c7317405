// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "interfaces/IInterface.h"

// Parity codes of ISerialPort::Setup.
enum SerialParity : int {
  kParityNone = 0,
  kParityEven = 1,
  kParityOdd = 2,
  kParityMark = 3,
  kParitySpace = 4,
};

// Line mode codes of ISerialPort::Setup.
enum SerialMode : int {
  kModeRs232 = 0,
  kModeRs485 = 1,
  kModeRs422 = 2,
  kModeRs485P = 3,
};

// One open serial port of the host. Owned by the host; valid from ISerialFactory::OpenPort until
// ISerialFactory::ReleasePort. One thread may receive while others send or set up.
class ISerialPort : public IInterface {
 public:
  // slots 3, 4. Never called.
  virtual void reserved3() = 0;
  virtual void reserved4() = 0;

  // slot 5. Sets the line: baud rate in bits a second, parity code (SerialParity), 7 or 8 data
  // bits, 1 or 2 stop bits, mode code (SerialMode). Non-zero on success. Host threads.
  virtual int Setup(int baudrate, int parity, int dataBits, int stopBits, int mode) = 0;

  // slot 6. Sends lengthBytes bytes. The driver passes time-out 0 and ignores the result. Host
  // threads and the console thread.
  virtual int Send(const unsigned char* data, int lengthBytes, int timeoutMs) = 0;

  // slot 7. Waits at most timeoutMs milliseconds for one byte and stores it. Non-zero when a byte
  // was stored, 0 on time-out. The last argument is always 0. Receive task.
  virtual int Receive(unsigned char* byte, int timeoutMs, int reserved) = 0;
};
