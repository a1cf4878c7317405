// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <csignal>
#include <fstream>
#include <iterator>
#include <memory>
#include <string>
#include <vector>

#include "host/base/ChildProcess.h"
#include "host/base/Deadline.h"
#include "tests/host/support/TemporaryFolder.h"
#include "tests/support/PluginLibrary.h"

// A run of the program with the plug-in of this build, and with a store folder and a folder of
// control sockets of its own. `environment` can name others: the last one counts.
class ProgramRun {
 public:
  static constexpr int kLimitMs = 30000;
  static Deadline Limit() { return Deadline::After(kLimitMs); }

  explicit ProgramRun(const std::vector<std::string>& arguments,
                      const std::string& environment = "") {
    // The shell takes care of stderr and the environment.
    const std::string script =
        "exec env -u NO_COLOR -u LOKA_PORT LOKA_PLUGIN='" + PluginLibrary::DefaultPath() +
        "' XDG_STATE_HOME='" + folder_.Path().string() + "' XDG_CONFIG_HOME='" +
        folder_.Path().string() + "' LOKA_RUNTIME_DIR='" + folder_.File("control") + "' " +
        environment + " \"$0\" \"$@\" 2>'" + folder_.File("stderr") + "'";
    std::vector<std::string> all = {"sh", "-c", script, LOKA_PROGRAM_PATH};
    all.insert(all.end(), arguments.begin(), arguments.end());
    process_ = std::make_unique<ChildProcess>("/bin/sh", all);
  }

  ~ProgramRun() { Signal(SIGTERM); }
  ProgramRun(const ProgramRun&) = delete;
  ProgramRun& operator=(const ProgramRun&) = delete;

  int ProcessId() const { return process_->ProcessId(); }
  std::string StoreFile() const { return folder_.File("loka/store.db"); }

  // The next line of stdout, or "(none)".
  std::string Line() {
    std::string line;
    return process_->ReadLine(Deadline::After(kLimitMs), &line) ? line : "(none)";
  }

  // Everything on stdout up to its end.
  std::string Output() {
    std::string all;
    for (std::string line; process_->ReadLine(Deadline::After(kLimitMs), &line);) {
      all += line + "\n";
    }
    return all;
  }

  std::string Errors() const {
    std::ifstream file(folder_.File("stderr"));
    return {std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>()};
  }

  // Waits until stderr holds a text.
  bool AwaitErrors(const std::string& text) const {
    const Deadline deadline = Deadline::After(kLimitMs);
    while (Errors().find(text) == std::string::npos) {
      if (deadline.HasPassed()) {
        return false;
      }
      Deadline::After(2).Sleep();
    }
    return true;
  }

  // A line on its standard input, which Status ends.
  bool Type(const std::string& line) const { return process_->WriteLine(line); }

  void Signal(int signalNumber) const { process_->Signal(signalNumber); }

  // The exit status once the program has ended.
  int Status() { return process_->Wait(Deadline::After(kLimitMs)); }

 private:
  TemporaryFolder folder_;
  std::unique_ptr<ChildProcess> process_;
};
