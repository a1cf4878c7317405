// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "host/InstanceOptions.h"

// Shows each token that a device sends until a signal ends it: one line on stdout with time, length
// in bytes, text and bytes in hexadecimal; everything else goes to stderr. Each token is
// acknowledged once it is printed. Returns the exit status of the program.
int RunWatch(const InstanceOptions& options);
