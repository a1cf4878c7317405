// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "interfaces/INamedInterface.h"

class ISerialPort;

// Host service that opens serial ports by name. Required.
class ISerialFactory : public INamedInterface {
 public:
  // slot 5. Opens the named port ("com1" to "com16" on a panel). Null when it cannot be opened. The
  // caller hands the port back with ReleasePort. Host threads and the console thread.
  virtual ISerialPort* OpenPort(const char* name) = 0;

  // slot 6. Closes and takes back a port that OpenPort returned. Same threads as OpenPort, and the
  // receive task where a stop did not wait for it.
  virtual void ReleasePort(ISerialPort* port) = 0;
};
