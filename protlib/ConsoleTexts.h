// SPDX-License-Identifier: Apache-2.0
#pragma once

// Replies of the console commands that every driver has.
namespace ConsoleTexts {

inline constexpr const char* kHelp =
    "help - displays this message\n"
    "info - displays information about the protocol version\n"
    "xml  - displays the protocol xml description\n"
    "read uri - reads data pointed by uri string\n"
    "write uri hexData - writes data pointed by uri string\n"
    "lasterror - displays the last protocol error\n"
    "getmaxtm - displays the max time for executing a single read/write access\n";

inline constexpr const char* kReadWithoutUri = "error: missing parameter (URI string)\n";
inline constexpr const char* kWriteWithoutData = "error: missing parameters (URI string + data)\n";
inline constexpr const char* kWrongDataLength = "error: incorrect length of data to write\n";
inline constexpr const char* kWrongHexData = "error: incorrect hex data\n";
inline constexpr const char* kWritten = "written ok\n";

}  // namespace ConsoleTexts
