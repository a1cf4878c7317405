// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <string_view>

// How bytes of a device are shown. They never reach a terminal as they are: a device could send
// escape sequences. All functions: any thread.

// The bytes as ASCII text: printable characters as they stand, a backslash and a double quote with
// a backslash in front, the usual C letters (\n, \r, \t, \a, \b, \f, \v), everything else as \x and
// two lower-case hexadecimal digits. Without quotes around it.
std::string EscapeBytes(std::string_view bytes);

// Two upper-case hexadecimal digits a byte, separated by blanks: "02 41 42 03".
std::string HexBytes(std::string_view bytes);

// The same without the blanks: "02414203".
std::string CompactHex(std::string_view bytes);

// Turns hexadecimal digits, blanks allowed between the bytes, into bytes. False, with `bytes`
// untouched, for any other character or half a byte.
bool ParseHexBytes(std::string_view text, std::string* bytes);
