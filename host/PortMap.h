// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <map>
#include <string>

// Which path stands behind a port name of the configuration. Filled from --port words:
// "com1=/dev/ttyUSB0" maps one of com1 to com16, a bare path stands for whatever name the
// configuration uses. Filled by one thread, afterwards read by any.
class PortMap {
 public:
  // Takes one --port word. False, with the reason in `error`, for a name that is not com1 to com16,
  // an empty path, a name or a bare path that was already given.
  bool Add(const std::string& word, std::string* error);

  // The path for a port name: its own entry first, then the bare path; empty when there is none.
  std::string PathFor(const std::string& portName) const;

  bool IsEmpty() const { return paths_.empty() && barePath_.empty(); }

 private:
  std::map<std::string, std::string> paths_;
  std::string barePath_;
};
