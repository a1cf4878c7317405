// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <cstddef>
#include <string>

// What a line typed in `term` means, and how a token is shown there. All functions: any thread.

enum class InputMode { kText, kHex, kConsole };
enum class OutputMode { kText, kHex, kDump, kRaw };

// Names in the order of the values.
inline constexpr std::array<const char*, 3> kInputModeNames = {"text", "hex", "console"};
inline constexpr std::array<const char*, 4> kOutputModeNames = {"text", "hex", "dump", "raw"};

inline const char* NameOf(InputMode mode) {
  return kInputModeNames.at(static_cast<std::size_t>(mode));
}
inline const char* NameOf(OutputMode mode) {
  return kOutputModeNames.at(static_cast<std::size_t>(mode));
}

// False for a name that is none.
bool ParseMode(const std::string& name, InputMode* mode);
bool ParseMode(const std::string& name, OutputMode* mode);

// The one that comes next; the first one behind the last.
InputMode NextOf(InputMode mode);
OutputMode NextOf(OutputMode mode);
