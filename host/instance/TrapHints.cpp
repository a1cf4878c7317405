// SPDX-License-Identifier: Apache-2.0
#include "host/instance/TrapHints.h"

#include <algorithm>

namespace {

constexpr const char* kTooLong = "token too long";

std::string Count(unsigned int count, const std::string& one, const std::string& many) {
  return std::to_string(count) + " " + (count == 1 ? one : many);
}

bool StartsWith(const std::string& text, const std::string& start) {
  return text.compare(0, start.size(), start) == 0;
}

}  // namespace

std::vector<std::string> HintsForLongToken(const std::string& driverText,
                                           unsigned int lengthBytes) {
  if (driverText != kTooLong) {
    return {};
  }
  return {std::to_string(lengthBytes) + " bytes waiting, use string-" +
          std::to_string(lengthBytes + 1) + " or longer"};
}

std::vector<std::string> HintsForCutToken(std::size_t shownBytes, unsigned int lengthBytes) {
  if (shownBytes >= lengthBytes) {
    return {};
  }
  return {"the token has " + std::to_string(lengthBytes) +
              " bytes and a zero byte behind the first " + std::to_string(shownBytes) +
              "; a text tag ends there",
          kHintHexTokens};
}

std::string HintForClearedTokens(unsigned int count) {
  return Count(count, "waiting token", "waiting tokens") + " cleared: SP_Done empties the queue";
}

void DropClearedHint(Answer* answer) {
  const auto cleared = answer->data.value("cleared", 0U);
  std::vector<std::string>& hints = answer->hints;
  hints.erase(std::remove(hints.begin(), hints.end(), HintForClearedTokens(cleared)), hints.end());
}

std::vector<std::string> HintsForUri(const std::string& uri) {
  if (std::count(uri.begin(), uri.end(), '?') >= 2) {
    return {"loka tags lists the memory types with a data type that fits"};
  }
  return {"a tag address is NODE?MEMORYTYPE?DATATYPE, as in 0?tokens_available?unsignedInt"};
}

std::vector<std::string> HintsForConnectAgain(bool wasConnected) {
  return {wasConnected ? "the port is connected already: the driver takes the value as a token to "
                         "send; loka connect on reads the state first"
                       : "the port is disconnected already: the driver takes the value as a token "
                         "to send; loka connect off reads the state first"};
}

std::vector<std::string> HintsForConsole(const std::string& line, const std::string& reply) {
  if (!StartsWith(line, "set_")) {
    return {};
  }
  if (reply != "OK") {
    return {};
  }
  return {"in effect until the driver is restarted and never stored; loka set keeps a setting"};
}
