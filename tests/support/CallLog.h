// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <mutex>
#include <string>
#include <vector>

// Everything that the plug-in did to the host, in order, as readable lines; and, apart from them,
// what it must never do ("violations"), which are kept even while recording is off. Any thread.
class CallLog {
 public:
  void Add(const std::string& line);
  void AddViolation(const std::string& text);

  // Off for runs of millions of calls that nobody looks at.
  void SetRecording(bool on);

  // The lines recorded so far, each ended by a new-line.
  std::string Text() const;

  // The same, and starts again with an empty record.
  std::string Take();

  // Number of lines that are equal to `line`.
  int Count(const std::string& line) const;

  std::string Violations() const;
  void ClearViolations();

 private:
  mutable std::mutex mutex_;
  bool recording_ = true;
  std::vector<std::string> lines_;
  std::string violations_;
};
