// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

// The name of an error number (errno(3)): "EIO". Empty for 0, "error 4711" for a number without a
// name. Any thread.
std::string ErrorName(int errorNumber);
