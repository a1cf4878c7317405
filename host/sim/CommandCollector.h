// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <optional>
#include <string>

// Collects the bytes of a command up to its end: CR, LF or ETX. STX begins anew; an end behind
// nothing is ignored, so that CR LF ends one command. One thread.
class CommandCollector {
 public:
  // What does not fit is dropped up to the next end.
  static constexpr std::size_t kMaxCommandBytes = 4096;

  // The command, without its end, when this byte completes one.
  std::optional<std::string> OnByte(char byte);

  // What has come without an end; nothing when there is nothing.
  std::optional<std::string> Take();

 private:
  std::string command_;
};
