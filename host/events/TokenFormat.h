// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

#include "host/events/HostEvent.h"

// How a token is written, from a format like "%t %n %p":
//
//   %t time of day   %n number   %l length in bytes   %p payload, escaped   %x payload in hex
//   %a tokens waiting   %P port   %j the whole event as JSON   %% a percent sign
//   \n \t \\ as in C
//
// Any thread.
class TokenFormat {
 public:
  // False, with what was expected in `error`, for anything else behind a percent sign.
  static bool Parse(const std::string& text, TokenFormat* format, std::string* error);

  // The token's line without a line end. The event must be a token.
  std::string Write(const HostEvent& event) const;

 private:
  struct Piece {
    char letter = 0;  // 0: the text as it stands
    std::string text;
  };

  std::vector<Piece> pieces_;
};
