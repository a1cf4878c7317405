// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

// What a command tells its user. Any thread.

// One line on standard error, with the program's name in front, in one call, so that lines of
// several threads do not mix.
void TellUser(const std::string& text);

// Writes a result to standard output, byte for byte, and sees to it that it has gone out. False,
// with the reason told on standard error, when it has not: a full disk, a closed pipe.
bool WriteResult(const std::string& text);
