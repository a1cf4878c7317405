// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <memory>
#include <string>
#include <vector>

#include "host/port/PseudoTerminal.h"
#include "tests/host/support/PluginConfiguration.h"
#include "tests/host/support/ProgramRun.h"

// "loka run" on a pseudo-terminal, and other commands beside it: all with the same control folder
// and the same store, both of this object alone.
class InstanceRun {
 public:
  // What one command left behind.
  struct Result {
    int status = -1;
    std::string output;
    std::string errors;
  };

  // The configuration is that of TestConfiguration with `more`. Whatever is sent by the device is
  // left in the queue.
  explicit InstanceRun(const std::string& more, const std::string& acknowledge = "never") {
    run_ = std::make_unique<ProgramRun>(
        std::vector<std::string>{"run", line_.Path(), "--config", TestConfiguration(more), "--ack",
                                 acknowledge, "-v"},
        Environment());
    isReady_ = run_->AwaitErrors("commands attach at");
  }

  ~InstanceRun() { Stop(); }
  InstanceRun(const InstanceRun&) = delete;
  InstanceRun& operator=(const InstanceRun&) = delete;

  bool IsReady() const { return isReady_; }
  std::string Errors() const { return run_ == nullptr ? "" : run_->Errors(); }
  const PseudoTerminal& Line() const { return line_; }
  std::string StoreFile() const { return folder_.File("state/loka/store.db"); }
  std::string File(const std::string& name) const { return folder_.File(name); }

  Result Loka(const std::vector<std::string>& arguments) const {
    ProgramRun command(arguments, Environment());
    Result result;
    result.output = command.Output();
    result.status = command.Status();
    result.errors = command.Errors();
    return result;
  }

  // A command that goes on while the test does something.
  std::unique_ptr<ProgramRun> Begin(const std::vector<std::string>& arguments) const {
    return std::make_unique<ProgramRun>(arguments, Environment());
  }

  // What the command prints, for one that succeeds.
  std::string Output(const std::vector<std::string>& arguments) const {
    const Result result = Loka(arguments);
    return result.status == 0 ? result.output
                              : "status " + std::to_string(result.status) + ": " + result.errors;
  }

  // The device sends; true once that many tokens wait.
  bool DeviceSends(const std::string& bytes, const std::string& waiting) const {
    const Deadline deadline = Deadline::After(ProgramRun::kLimitMs);
    if (!line_.Send(bytes, deadline)) {
      return false;
    }
    while (Output({"read", "0?tokens_available?unsignedInt"}) != waiting + "\n") {
      if (deadline.HasPassed()) {
        return false;
      }
      Deadline::After(5).Sleep();
    }
    return true;
  }

  // Ends the instance; the commands that follow start one of their own.
  int Stop() {
    if (run_ == nullptr) {
      return 0;
    }
    run_->Signal(SIGTERM);
    const int status = run_->Status();
    run_.reset();
    return status;
  }

 private:
  std::string Environment() const {
    return "LOKA_RUNTIME_DIR='" + folder_.File("control") + "' XDG_STATE_HOME='" +
           folder_.File("state") + "'";
  }

  TemporaryFolder folder_;
  PseudoTerminal line_;
  std::unique_ptr<ProgramRun> run_;
  bool isReady_ = false;
};
