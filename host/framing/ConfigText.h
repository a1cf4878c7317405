// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

// What stands between the keys of a configuration text.
inline constexpr const char* kConfigWhiteSpace = " \t\n\v\f\r";

// The few things that the host itself looks up in a configuration text, for its messages. The
// driver alone decides what the text means. Any thread.

// The value behind "key=", up to the next white space, in the section that "CfgVer=1" opens; the
// fallback when the key is not there. The key must stand at the start or behind white space.
std::string ConfigValue(const std::string& configuration, const std::string& key,
                        const std::string& fallback);
