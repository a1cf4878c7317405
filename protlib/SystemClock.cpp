// SPDX-License-Identifier: Apache-2.0
#include "protlib/SystemClock.h"

#include <sys/time.h>

unsigned long long currentTimeStamp() {
  timeval now = {};
  gettimeofday(&now, nullptr);
  return static_cast<unsigned long long>(now.tv_sec) * 1000ULL +
         static_cast<unsigned long long>(now.tv_usec) / 1000ULL;
}
