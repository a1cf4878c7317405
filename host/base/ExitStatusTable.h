// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>

#include "host/base/ExitStatus.h"

// What each exit status means, for the manual page. Any thread.
struct ExitStatusMeaning {
  ExitStatus status;
  const char* number;  // "128 + n" for all signals
  const char* meaning;
};

inline constexpr std::array<ExitStatusMeaning, 10> kExitStatusTable = {{
    {ExitStatus::kDone, "0", "done"},
    {ExitStatus::kRefused, "1", "the driver or a tag refused, its text is on standard error"},
    {ExitStatus::kUsage, "2", "wrong use of the command line"},
    {ExitStatus::kPlugin, "3",
     "the plug-in cannot be loaded, lacks an interface or has no readable description"},
    {ExitStatus::kConfiguration, "4",
     "the configuration was rejected, with the driver's own message"},
    {ExitStatus::kPort, "5",
     "the port cannot be opened or set up: rights, busy (and who holds it) or absent"},
    {ExitStatus::kPortLost, "6", "the line was lost for good, or the running instance has ended"},
    {ExitStatus::kDifference, "7", "the driver and the host read the same bytes differently"},
    {ExitStatus::kTimeout, "27", "what was waited for did not come in time"},
    {ExitStatus::kFirstSignal, "128 + n", "ended by signal n"},
}};
