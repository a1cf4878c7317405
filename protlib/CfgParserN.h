// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include "protlib/CfgParser.h"

// What becomes of the text that CfgParser finds: typed values and error messages.
namespace CfgParserN {

// Replaces every "&nbsp;" by a space, the only way to put one into a value. Always true.
bool parseValue(const std::string& in, std::string& out);

// Exactly "true" or "false". Anything else gives false and leaves `out` untouched.
bool parseValue(const std::string& in, bool& out);

// As strtol does in base 0: decimal, 0x hexadecimal, leading-zero octal; text that is no number
// gives 0. Always true.
bool parseValue(const std::string& in, int& out);

// The message for a look-up that failed.
std::string getErrorString(CfgParser::parseResult r, const char* name);

}  // namespace CfgParserN
