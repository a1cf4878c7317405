// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <string_view>

// Hex text: pairs of hexadecimal digits, high nibble first, or the word "none". Both "none" and the
// empty text stand for no bytes. Any thread.

// Whether the text is "none" or an even number of digits 0-9, A-F, a-f (none at all included). Null
// is not.
bool isHex(const char* text);

// The bytes that the text stands for. Nothing is checked: a character that is no digit counts its
// code minus 87, modulo 256, and the last character of an odd length is paired with a zero, which
// counts 169. Text that comes from outside goes through isHex first.
std::string fromHex(const std::string& text);

// Two upper-case digits a byte. The second form replaces what `text` holds and reuses its memory.
std::string ToHex(std::string_view bytes);
void ToHex(std::string_view bytes, std::string& text);
