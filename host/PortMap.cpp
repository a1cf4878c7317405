// SPDX-License-Identifier: Apache-2.0
#include "host/PortMap.h"

namespace {

constexpr int kPortNames = 16;

bool IsPortName(const std::string& name) {
  for (int number = 1; number <= kPortNames; ++number) {
    if (name == "com" + std::to_string(number)) {
      return true;
    }
  }
  return false;
}

}  // namespace

bool PortMap::Add(const std::string& word, std::string* error) {
  const std::size_t equals = word.find('=');
  // A slash in front of the sign belongs to a path: /dev/serial/by-id/a=b is a bare path.
  const bool isNamed = equals != std::string::npos && word.find('/') > equals;
  if (!isNamed) {
    if (word.empty()) {
      *error = "a port needs a path";
    } else if (!barePath_.empty()) {
      *error = "only one port can be given without a name";
    } else {
      barePath_ = word;
      return true;
    }
    return false;
  }
  const std::string name = word.substr(0, equals);
  const std::string path = word.substr(equals + 1);
  if (!IsPortName(name)) {
    *error = "'" + name + "' is no port name; com1 to com16 are";
  } else if (path.empty()) {
    *error = "a path is missing behind '" + name + "='";
  } else if (!paths_.emplace(name, path).second) {
    *error = name + " is given twice";
  } else {
    return true;
  }
  return false;
}

std::string PortMap::PathFor(const std::string& portName) const {
  const auto found = paths_.find(portName);
  return found == paths_.end() ? barePath_ : found->second;
}
