// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

#include "host/commands/InstanceAccess.h"

namespace CLI {
class App;
}

// What to send, in one of the ways of the command line.
struct PayloadFlags {
  std::string text;     // -m
  std::string hexText;  // -x
  std::string file;     // -f, "-" for standard input

  // Adds -m, -x and, with files, -f.
  void Add(CLI::App* command, bool withFile);

  // The bytes of -m, -x or -f. False with the reason in `error`.
  bool Bytes(std::string* bytes, std::string* error) const;
};

// `loka send`: sends one token, or one a line.
struct SendOptions {
  InstanceAccess access;
  PayloadFlags payload;
  bool isByLine = false;  // -l: each line of standard input
};

void AddSend(CLI::App* app, SendOptions* options);
int RunSend(SendOptions* options);

// `loka ask`: sends, then prints the next token.
struct AskOptions {
  InstanceAccess access;
  PayloadFlags payload;
  double limitSeconds = 5;  // -W
  bool isFresh = false;
  bool isJson = false;
  bool isHex = false;
};

void AddAsk(CLI::App* app, AskOptions* options);
int RunAsk(AskOptions* options);
