// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

// "No node" in the parameter stores; the driver's own settings all use it.
inline constexpr int kNoNode = -1;

// What kind of value a parameter holds.
enum ParameterKind : int {
  kBooleanParameter = 0,
  kIntegerParameter = 1,
  kStringParameter = 2,
};
