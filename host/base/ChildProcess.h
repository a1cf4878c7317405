// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

class Deadline;

// Another process whose stdin and stdout are pipes of ours, talked to in lines; its stderr is ours.
// It gets the default treatment of signals and no other open file. One thread.
class ChildProcess {
 public:
  // Runs a program file with these arguments (the first is the program's name). Throws
  // std::system_error when that fails.
  ChildProcess(const std::string& file, const std::vector<std::string>& arguments);

  // Closes the pipes and waits for the end, at most 5000 ms; then the process is killed.
  ~ChildProcess();

  ChildProcess(const ChildProcess&) = delete;
  ChildProcess& operator=(const ChildProcess&) = delete;

  int ProcessId() const { return processId_; }

  // Sends it a signal (kill(2)) unless its end was already seen.
  void Signal(int signalNumber) const;

  // False when the process no longer listens.
  bool WriteLine(const std::string& line) const;

  // The next line without its end; false when the process closes its stdout or the deadline passes
  // before the line is complete.
  bool ReadLine(const Deadline& deadline, std::string* line);

  // Closes its stdin and waits for the end. Its exit status (128 + n for a signal), or -1 when the
  // deadline passes first.
  int Wait(const Deadline& deadline);

 private:
  void CloseInput();

  int processId_ = -1;
  int input_ = -1;
  int output_ = -1;
  bool isOver_ = false;
  int status_ = 0;
  std::string pending_;
};
