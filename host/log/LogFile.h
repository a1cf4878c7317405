// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>
#include <memory>
#include <string>

#include "host/events/EventSink.h"
#include "host/text/Output.h"

// Appends each event to a file, one line with its time (UTC) and port each, device bytes escaped. A
// file of 10 MiB is put aside under a number, NAME.1.EXTENSION being the newest; five are kept. Any
// thread.
class LogFile : public EventSink {
 public:
  // Told once, on the thread of the event, when the file cannot be written any more.
  using ProblemHandler = std::function<void(const std::string& text)>;

  // Whether this program has it (a build option).
  static bool IsBuiltIn();

  // Opens or makes the file. Null, with the reason in `error`, when that fails.
  static std::unique_ptr<LogFile> Open(const std::string& path, ProblemHandler onProblem,
                                       std::string* error);
};

// The log for a command that takes one: null without a path, and with the reason in `error` when
// the file cannot be opened. What goes wrong later is told on standard error.
inline std::unique_ptr<LogFile> OpenLog(const std::string& path, std::string* error) {
  return path.empty() ? nullptr : LogFile::Open(path, TellUser, error);
}
