// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

#include "host/port/PortHolder.h"

// Why a port could not be opened or set up.
struct PortProblem {
  enum class Kind {
    kNone,
    kNotMapped,  // the port name stands for no path
    kAbsent,     // nothing there
    kNoRights,   // it is there, but this user may not open it
    kBusy,       // another process holds it
    kNotSerial,  // no terminal device
    kSettings,   // the line settings are not valid
    kOther,
  };

  Kind kind = Kind::kNone;
  std::string portName;             // as in the configuration
  std::string path;                 // empty for kNotMapped
  std::string text;                 // one sentence, without the path, without a full stop
  std::vector<PortHolder> holders;  // for kBusy; empty when they cannot be seen
};
