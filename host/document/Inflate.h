// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <string_view>

// Inflates one zlib stream (RFC 1950) that fills `stream` to its last byte. False, with the reason
// in `error`, for a stream that is damaged, ends early or goes on, and for one that inflates to
// more than `maxBytes`; the memory used stays within some multiples of that. Any thread.
bool Inflate(std::string_view stream, int maxBytes, std::string* text, std::string* error);
