// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <utility>
#include <vector>

// Configuration texts as the host reads and changes them. Any thread.

// Puts "key=value" into the section that "CfgVer=1" opens: in place of the value that counts there,
// else at the section's end. Without that marker a section is begun behind the text.
std::string WithConfigValue(const std::string& configuration, const std::string& key,
                            const std::string& value);

// The words of that section that hold an equals sign, cut at the first one, in their order.
std::vector<std::pair<std::string, std::string>> ConfigPairs(const std::string& configuration);

// The words of that section without an equals sign, which no reader looks at.
std::vector<std::string> ConfigStrayWords(const std::string& configuration);

// Reads what stands behind --config: "-" is standard input, a word with "=" or a blank in it the
// text itself, anything else the name of a file. A line feed at the end is taken off. False, with
// the reason in `error`, for what cannot be read, is longer than 1 MiB or holds a zero byte.
bool ReadConfiguration(const std::string& word, std::string* configuration, std::string* error);
