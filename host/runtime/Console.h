// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

// What a driver answers to a console command.
struct ConsoleReply {
  // The driver's result. Some commands that do not do what was asked are true all the same.
  bool isDone = false;
  std::string text;    // as the driver gave it; may hold any byte but zero
  bool isCut = false;  // there was more than fits
};

// Where console commands go: a driver instance, in this process or behind something that reaches
// one in another process. One thread.
class Console {
 public:
  Console() = default;
  virtual ~Console() = default;
  Console(const Console&) = delete;
  Console& operator=(const Console&) = delete;

  // Runs one command; the line goes to the driver as it stands.
  virtual ConsoleReply Run(const std::string& line) = 0;
};
