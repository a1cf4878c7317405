// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <string>
#include <string_view>

class TextStyle;

// Bytes in hexadecimal and, behind three blanks, as characters with a dot for each that is not
// printable ASCII: "02 53 54 03   .ST.". One line however many bytes there are. Any thread.
std::string HexDump(std::string_view bytes);

// The same for a frame whose first and last bytes are dim: its prefix and its suffix.
std::string HexDump(std::string_view frame, std::size_t prefixBytes, std::size_t suffixBytes,
                    const TextStyle& style);
