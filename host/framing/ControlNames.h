// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <string_view>

// Names of control bytes as people write them in manuals of scanners and scales. Any thread.

// Reads bytes written as hexadecimal digits, with or without "0x", as names of control bytes (STX,
// ETX, CR, LF, CRLF, NUL ... in either case, angle brackets allowed) or as a row of both with
// blanks, commas or plus signs between: "0202", "STX", "CR LF", "03+CRLF". "none" and the empty
// text are no bytes. FF is the byte FF; the form feed is 0C. False, with `bytes` untouched and the
// reason in `error`, for anything else.
bool ParseControlText(std::string_view text, std::string* bytes, std::string* error);

// The usual name of a control byte ("STX", "CR", "DEL"); empty for any other byte.
std::string_view ControlName(unsigned char byte);
