// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <unistd.h>

#include <filesystem>
#include <memory>
#include <nlohmann/json.hpp>
#include <stdexcept>
#include <string>
#include <vector>

#include "tests/host/control/ControlClient.h"
#include "tests/host/support/PluginConfiguration.h"
#include "tests/host/support/ProgramRun.h"

// Where instances of "loka run" live one after the other with the same store and the same control
// folder, however each of them ended.
class RunBench {
 public:
  using Json = nlohmann::json;

  std::string File(const std::string& name) const { return folder_.File(name); }
  std::string StoreFile() const { return File("state/loka/store.db"); }
  std::string SocketFile() const { return File("control/com1.sock"); }

  // What a command gets to find the store and the instance; `wrapper` is a command that runs loka,
  // as in "prlimit --fsize=4096".
  std::string Environment(const std::string& wrapper = "") const {
    return "LOKA_RUNTIME_DIR='" + File("control") + "' XDG_STATE_HOME='" + File("state") + "' " +
           wrapper;
  }

  // "loka run" on a port; com1 with the configuration of TestConfiguration and `more`.
  std::unique_ptr<ProgramRun> Begin(const std::string& portWord, const std::string& more,
                                    const std::vector<std::string>& options = {},
                                    const std::string& wrapper = "") const {
    std::vector<std::string> arguments = {"run", portWord, "--config", TestConfiguration(more)};
    arguments.insert(arguments.end(), options.begin(), options.end());
    return std::make_unique<ProgramRun>(arguments, Environment(wrapper));
  }

  // The same, once commands can attach. Throws when it does not come to that.
  std::unique_ptr<ProgramRun> BeginReady(const std::string& portWord, const std::string& more,
                                         const std::vector<std::string>& options = {},
                                         const std::string& wrapper = "") const {
    auto run = Begin(portWord, more, options, wrapper);
    if (!run->AwaitErrors("commands attach at")) {
      throw std::runtime_error("loka run is not ready: " + run->Errors());
    }
    return run;
  }

  // A command beside it.
  std::unique_ptr<ProgramRun> Command(const std::vector<std::string>& arguments,
                                      const std::string& wrapper = "") const {
    return std::make_unique<ProgramRun>(arguments, Environment(wrapper));
  }

  // From now on another user runs the commands here.
  void GiveTo(unsigned int userId) const {
    namespace fs = std::filesystem;
    (void)!chown(folder_.Path().c_str(), userId, userId);
    for (const auto& entry : fs::recursive_directory_iterator(folder_.Path())) {
      (void)!chown(entry.path().c_str(), userId, userId);
    }
  }

  // A number that the running instance counts, as "tokens" or "drops/no-suffix"; 0 when there is
  // none.
  std::uint64_t Count(const std::string& path) const {
    const Json answer = ControlClient(SocketFile()).Ask(R"({"op":"stats","id":1})");
    const Json::json_pointer place("/data/" + path);
    return answer.contains(place) ? answer[place].get<std::uint64_t>() : 0;
  }

  // Waits until a count has reached a number.
  bool AwaitCount(const std::string& path, std::uint64_t count) const {
    const Deadline deadline = Deadline::After(ProgramRun::kLimitMs);
    while (Count(path) < count) {
      if (deadline.HasPassed()) {
        return false;
      }
      Deadline::After(5).Sleep();
    }
    return true;
  }

 private:
  TemporaryFolder folder_;
};
