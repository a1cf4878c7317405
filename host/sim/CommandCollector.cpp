// SPDX-License-Identifier: Apache-2.0
#include "host/sim/CommandCollector.h"

#include <utility>

namespace {

constexpr char kStx = '\x02';
constexpr char kEtx = '\x03';

}  // namespace

std::optional<std::string> CommandCollector::OnByte(char byte) {
  if (byte == '\r' || byte == '\n' || byte == kEtx) {
    return Take();
  }
  if (byte == kStx) {
    command_.clear();
  } else if (command_.size() < kMaxCommandBytes) {
    command_ += byte;
  }
  return std::nullopt;
}

std::optional<std::string> CommandCollector::Take() {
  if (command_.empty()) {
    return std::nullopt;
  }
  return std::exchange(command_, {});
}
