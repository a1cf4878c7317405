// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <map>
#include <string>

#include "host/port/PortOptions.h"

// Which path stands behind a port name of the configuration. Filled from --port words:
// "com1=/dev/ttyUSB0" maps one of com1 to com16, a bare path stands for whatever name the
// configuration uses. Behind the path may stand options, see PortOptions. Filled by one thread,
// afterwards read by any.
class PortMap {
 public:
  // Takes one --port word. False, with the reason in `error`, for a name that is not com1 to com16,
  // an empty path, an option that is not right, a name or a bare path that was already given.
  bool Add(const std::string& word, std::string* error);

  // The path for a port name: its own entry first, then the bare path; empty when there is none.
  std::string PathFor(const std::string& portName) const;

  // The path with its options; the path in it is empty when there is none.
  PortOptions OptionsFor(const std::string& portName) const;

  // The name of the only entry, when it is one for a name; empty otherwise.
  std::string OnlyName() const {
    return ports_.size() == 1 && barePort_.path.empty() ? ports_.begin()->first : "";
  }

  bool IsEmpty() const { return ports_.empty() && barePort_.path.empty(); }

 private:
  std::map<std::string, PortOptions> ports_;
  PortOptions barePort_;
};
