// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <string_view>

// Bytes in hexadecimal and, behind three blanks, as characters with a dot for each that is not
// printable ASCII: "02 53 54 03   .ST.". One line however many bytes there are. Any thread.
std::string HexDump(std::string_view bytes);
