// SPDX-License-Identifier: Apache-2.0
#pragma once

// Puts a terminal back to what it was, whichever way the program ends: when the object goes, when a
// second signal ends the program at once, and when the program crashes. One object at a time; made
// and destroyed on one thread.
class TerminalState {
 public:
  // Remembers the state of the terminal behind the descriptor (tcgetattr(3)). Does nothing at all
  // when there is no terminal.
  explicit TerminalState(int fileDescriptor);
  ~TerminalState();

  TerminalState(const TerminalState&) = delete;
  TerminalState& operator=(const TerminalState&) = delete;
};
