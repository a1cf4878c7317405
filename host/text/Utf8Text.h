// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <string_view>

// UTF-8 text that comes from outside. All functions: any thread.

// True for well-formed UTF-8: shortest forms only, no surrogates, nothing above U+10FFFF.
bool IsUtf8(std::string_view text);

// The text for a terminal: control characters, those of U+0080 to U+009F included, and bytes that
// are no UTF-8 as \x and two hexadecimal digits a byte; a line feed and a tab stay.
std::string PrintableUtf8(std::string_view text);
