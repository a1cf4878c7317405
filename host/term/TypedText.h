// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <string_view>

// Reads a text with the escapes of C: \a \b \f \n \r \t \v \\ \" \' \? \e, \x and exactly two
// hexadecimal digits, one to three octal digits up to \377. It is what EscapeBytes writes.
// Everything else stands for itself. False, with `bytes` untouched and what was expected in
// `error`, for anything else behind a backslash. Any thread.
bool ParseTypedText(std::string_view text, std::string* bytes, std::string* error);
