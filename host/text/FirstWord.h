// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

// What stands in front of the first blank, as the driver's console takes its words. Any thread.
inline std::string FirstWord(const std::string& text) { return text.substr(0, text.find(' ')); }
