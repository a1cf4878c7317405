// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <nlohmann/json.hpp>
#include <string>
#include <vector>

#include "host/text/ByteText.h"
#include "tests/host/support/ProgramRun.h"

// "loka sim" with -j on a link in a folder of its own; collects what it tells.
class SimProcess {
 public:
  using Json = nlohmann::json;

  explicit SimProcess(const std::vector<std::string>& arguments) : run_(Arguments(arguments)) {
    Await("plugged");
  }

  std::string LinkPath() const { return folder_.File("port"); }
  ProgramRun& Run() { return run_; }

  // Reads on until the port reaches a state; false when the output ends before.
  bool Await(const std::string& state) {
    for (std::string line = run_.Line(); line != "(none)"; line = run_.Line()) {
      events_.push_back(Json::parse(line));
      if (events_.back()["ev"] == "port" && events_.back()["state"] == state) {
        return true;
      }
    }
    return false;
  }

  // Reads on to the end of the output.
  void Finish() { (void)Await("(none)"); }

  // The events of one kind that were read so far.
  std::vector<Json> Events(const std::string& kind) const {
    std::vector<Json> events;
    for (const Json& event : events_) {
      if (event["ev"] == kind) {
        events.push_back(event);
      }
    }
    return events;
  }

  static std::string BytesOf(const Json& event, const char* key) {
    std::string bytes = "(no hex)";
    (void)ParseHexBytes(event[key].get<std::string>(), &bytes);
    return bytes;
  }

  // All bytes that the line took, in order.
  std::string Wire() const {
    std::string wire;
    for (const Json& event : Events("sent")) {
      wire += BytesOf(event, "wire");
    }
    return wire;
  }

 private:
  std::vector<std::string> Arguments(const std::vector<std::string>& more) const {
    std::vector<std::string> all = {"sim"};
    all.insert(all.end(), more.begin(), more.end());
    all.insert(all.end(), {"--link", LinkPath(), "-j"});
    return all;
  }

  TemporaryFolder folder_;
  ProgramRun run_;
  std::vector<Json> events_;
};
