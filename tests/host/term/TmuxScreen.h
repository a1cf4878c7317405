// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <gtest/gtest.h>

#include <cstdlib>
#include <fstream>
#include <iterator>
#include <string>
#include <vector>

#include "host/base/Deadline.h"
#include "tests/host/support/TemporaryFolder.h"
#include "tests/support/PluginLibrary.h"

// A shell in a terminal of its own (tmux(1)), typed on and looked at as a person does. The server
// of the terminal is this object's alone and ends with it.
class TmuxScreen {
 public:
  static constexpr int kLimitMs = 30000;

  TmuxScreen() {
    std::ofstream(folder_.File("environment"))
        << "export LOKA_PLUGIN='" << PluginLibrary::DefaultPath() << "' XDG_STATE_HOME='"
        << folder_.File("state") << "' LOKA_RUNTIME_DIR='" << folder_.File("control") << "' HOME='"
        << folder_.Path().string() << "' LC_ALL=C.UTF-8 PS1='shell$ '\n"
        << "loka() { '" << LOKA_PROGRAM_PATH << "' \"$@\"; }\n"
        << "unset LOKA_PORT\nulimit -c 0\n";
    isRunning_ =
        Tmux("-f /dev/null new-session -d -x 100 -y 40 'ENV=" + folder_.File("environment") +
             " exec sh -i'") == 0;
  }
  ~TmuxScreen() { (void)Tmux("kill-server"); }
  TmuxScreen(const TmuxScreen&) = delete;
  TmuxScreen& operator=(const TmuxScreen&) = delete;

  bool IsRunning() const { return isRunning_ && Await("shell$"); }
  std::string File(const std::string& name) const { return folder_.File(name); }

  // Types the characters as they stand; and keys by their names, "C-t" or "Enter".
  void Type(const std::string& text) const { (void)Tmux("send-keys -l -- " + Quoted(text)); }
  void Press(const std::vector<std::string>& keys) const {
    std::string words;
    for (const std::string& key : keys) {
      words += " " + Quoted(key);
    }
    (void)Tmux("send-keys --" + words);
  }
  void Line(const std::string& text) const {
    Type(text);
    Press({"Enter"});
  }

  // Sends a signal to the program that the shell runs.
  void Signal(int signalNumber) const {
    const std::string shell = "$(tmux -S '" + folder_.File("tmux") + "' display -p '#{pane_pid}')";
    const std::string command = "pkill -" + std::to_string(signalNumber) + " -P " + shell;
    EXPECT_EQ(std::system(command.c_str()), 0) << command;
  }

  // Everything on the screen and above it.
  std::string Text() const {
    (void)Tmux("capture-pane -p -S -5000 > " + Quoted(folder_.File("screen")));
    std::ifstream file(folder_.File("screen"));
    return {std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>()};
  }

  // The last line that is not empty: where the cursor usually is.
  std::string LastLine() const {
    const std::string text = Text();
    const std::size_t end = text.find_last_not_of(" \n");
    if (end == std::string::npos) {
      return "";
    }
    const std::size_t begin = text.rfind('\n', end);
    return text.substr(begin + 1, end - begin);
  }

  // Both wait until it is so.
  bool Await(const std::string& part) const {
    return Wait([&] { return Text().find(part) != std::string::npos; });
  }
  bool AwaitLastLine(const std::string& line) const {
    return Wait([&] { return LastLine() == line; });
  }

 private:
  static std::string Quoted(const std::string& text) {
    std::string quoted = "'";
    for (const char c : text) {
      quoted += c == '\'' ? std::string("'\\''") : std::string(1, c);
    }
    return quoted + "'";
  }

  int Tmux(const std::string& words) const {
    const std::string command = "unset TMUX; tmux -S '" + folder_.File("tmux") + "' " + words;
    return std::system(command.c_str());
  }

  template <class Condition>
  static bool Wait(Condition isMet) {
    const Deadline deadline = Deadline::After(kLimitMs);
    while (!isMet()) {
      if (deadline.HasPassed()) {
        return false;
      }
      Deadline::After(20).Sleep();
    }
    return true;
  }

  TemporaryFolder folder_;
  bool isRunning_ = false;
};
