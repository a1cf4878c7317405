// SPDX-License-Identifier: Apache-2.0
#pragma once

// Reads the command line and runs what it asks for. Returns the exit status of the program (see
// ExitStatus). Main thread.
int RunCommandLine(int argumentCount, const char* const* arguments);
