// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <string>
#include <vector>

#include "host/instance/Answer.h"

// What the driver does in a way that people do not expect, said at the moment at which it matters,
// one line each. The driver's behaviour is settled; these lines are how the tool makes up for it.
// All functions: any thread.

inline constexpr const char* kHintConnectTwice =
    "the port was connected already: the driver has sent the byte 01 in a frame";
inline constexpr const char* kHintHexTokens =
    "with hex_tokens=true tokens are hexadecimal text and may hold every byte";

// A token that has no room in the tag it is read with.
std::vector<std::string> HintsForLongToken(const std::string& driverText, unsigned int lengthBytes);

// A token of which a text tag shows the part in front of a zero byte.
std::vector<std::string> HintsForCutToken(std::size_t shownBytes, unsigned int lengthBytes);

// SP_Done with tokens in the queue.
std::string HintForClearedTokens(unsigned int count);

// Takes that hint out of an answer whose number of tokens is shown in another way.
void DropClearedHint(Answer* answer);

// A tag address that the driver does not take.
std::vector<std::string> HintsForUri(const std::string& uri);

// A connect tag written with what the port is already: the driver sends it as a token, and refuses
// when it cannot.
std::vector<std::string> HintsForConnectAgain(bool wasConnected);

// A console command that changed something, or did not although its result is true.
std::vector<std::string> HintsForConsole(const std::string& line, const std::string& reply);
