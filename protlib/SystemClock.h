// SPDX-License-Identifier: Apache-2.0
#pragma once

// Milliseconds since 1970-01-01 00:00 UTC by the system clock, truncated. Any thread.
unsigned long long currentTimeStamp();
