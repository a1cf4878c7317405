// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

class ITag;

// Values of tags as texts: decimal numbers, 0 and 1 for a boolean, the characters in front of the
// first zero byte for a string, hexadecimal digits for everything else. Host byte order, which is
// the order of the tag's host value. All functions: any thread.

// What the bytes of a tag (GetVarLength of them) say.
std::string ShowTagValue(const ITag& tag, const std::string& bytes);

// The bytes to write for a text. False, with what was expected in `error`, when the tag cannot
// hold it.
bool ParseTagValue(const ITag& tag, const std::string& text, std::string* bytes,
                   std::string* error);

// The bytes of a tag's host value; 0 for a tag that has none.
std::size_t TagValueBytes(const ITag& tag);

// Whether the value is a text of bytes that may need escaping when it is shown.
bool IsTextTag(const ITag& tag);
