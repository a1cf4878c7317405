// SPDX-License-Identifier: Apache-2.0
#include "host/commands/ConnectCommand.h"

#include <CLI/CLI.hpp>

#include "host/events/JsonLine.h"
#include "host/text/Output.h"

namespace {

std::string TextOf(const std::string& state, const nlohmann::json& data) {
  const std::string now = data.value("connected", false) ? "connected" : "disconnected";
  const bool isChanged = data.value("changed", false);
  return state == "status" || isChanged ? now : now + " already; nothing done";
}

}  // namespace

void AddConnect(CLI::App* app, ConnectOptions* options) {
  CLI::App* const connect = app->add_subcommand("connect", "Open or close the port of a driver");
  connect->add_option("STATE", options->state, "What to do")
      ->type_name("on|off|status")
      ->required()
      ->check(CLI::IsMember({"on", "off", "status"}).description(""));
  connect->add_flag("-j,--json", options->isJson, "As a JSON object");
  AddInstanceAccess(connect, &options->access, false);
  connect->footer("Example: loka connect status");
}

int RunConnect(ConnectOptions* options) {
  options->access.acknowledges = false;
  options->access.connects = false;
  Answer answer;
  const auto instance = OpenInstance(&options->access, &answer);
  if (instance == nullptr) {
    return TellAnswer(answer);
  }
  answer = instance->Call({{"op", "connect"}, {"state", options->state}});
  if (answer.IsDone() &&
      !WriteResult((options->isJson ? JsonLine(answer.data) : TextOf(options->state, answer.data)) +
                   "\n")) {
    return static_cast<int>(ExitStatus::kRefused);
  }
  return EndOf(*instance, answer);
}
