// SPDX-License-Identifier: Apache-2.0
#include "host/term/TermModes.h"

#include <algorithm>

namespace {

template <class Mode, std::size_t count>
bool Parse(const std::array<const char*, count>& names, const std::string& name, Mode* mode) {
  const auto found = std::find(names.begin(), names.end(), name);
  if (found == names.end()) {
    return false;
  }
  *mode = static_cast<Mode>(found - names.begin());
  return true;
}

template <class Mode, std::size_t count>
Mode Next(const std::array<const char*, count>& /*names*/, Mode mode) {
  return static_cast<Mode>((static_cast<std::size_t>(mode) + 1) % count);
}

}  // namespace

bool ParseMode(const std::string& name, InputMode* mode) {
  return Parse(kInputModeNames, name, mode);
}

bool ParseMode(const std::string& name, OutputMode* mode) {
  return Parse(kOutputModeNames, name, mode);
}

InputMode NextOf(InputMode mode) { return Next(kInputModeNames, mode); }

OutputMode NextOf(OutputMode mode) { return Next(kOutputModeNames, mode); }
