// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

// The framing rules once more, in the plainest form, as an oracle for the receive task: cuts what a
// line does into tokens. A value of 0 to 255 is a byte, kSilence is a pause that ends a receive.
constexpr int kSilence = -1;

std::vector<std::string> ReferenceTokens(const std::vector<int>& line, const std::string& prefix,
                                         const std::string& suffix);
