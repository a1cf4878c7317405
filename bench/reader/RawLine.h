// SPDX-License-Identifier: Apache-2.0
#pragma once

// Opens a terminal device for blocking reads, raw, 115200 baud. Ends the process when it cannot.
int OpenRawLine(const char* device);
