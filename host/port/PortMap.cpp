// SPDX-License-Identifier: Apache-2.0
#include "host/port/PortMap.h"

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
  // Behind a slash or a comma the sign belongs to the path or to an option: /dev/serial/by-id/a=b
  // and /dev/ttyS1,flow=none are bare.
  const bool isNamed = equals != std::string::npos && word.find_first_of("/,") > equals;
  PortOptions port;
  if (!isNamed) {
    if (!ParsePortOptions(word, &port, error)) {
      return false;
    }
    if (!barePort_.path.empty()) {
      *error = "only one port can be given without a name";
      return false;
    }
    barePort_ = port;
    return true;
  }
  const std::string name = word.substr(0, equals);
  const std::string rest = word.substr(equals + 1);
  if (!IsPortName(name)) {
    *error = "'" + name + "' is no port name; com1 to com16 are";
  } else if (rest.empty() || rest[0] == ',') {
    *error = "a path is missing behind '" + name + "='";
  } else if (!ParsePortOptions(rest, &port, error)) {
    return false;
  } else if (!ports_.emplace(name, port).second) {
    *error = name + " is given twice";
  } else {
    return true;
  }
  return false;
}

PortOptions PortMap::OptionsFor(const std::string& portName) const {
  const auto found = ports_.find(portName);
  return found == ports_.end() ? barePort_ : found->second;
}

std::string PortMap::PathFor(const std::string& portName) const {
  return OptionsFor(portName).path;
}
