// SPDX-License-Identifier: Apache-2.0
#include "host/commands/WriteCommand.h"

#include <CLI/CLI.hpp>

#include "host/commands/SettingText.h"
#include "host/events/JsonLine.h"
#include "host/framing/ControlNames.h"
#include "host/instance/TrapHints.h"
#include "host/text/ByteText.h"
#include "host/text/Output.h"

namespace {

// What the write meant, where it meant more than the value that was given.
std::string ResultOf(Answer* answer) {
  if (answer->data.contains("applied")) {
    DropClearedHint(answer);
    return AppliedText(answer->data);
  }
  return answer->data.contains("key") ? StagedText({answer->data}) : "";
}

}  // namespace

void AddWrite(CLI::App* app, WriteOptions* options) {
  CLI::App* const write = app->add_subcommand("write", "Write the value of a tag");
  write->add_option("URI", options->uri, "Tag: NODE?MEMORYTYPE?DATATYPE")
      ->type_name("")
      ->required();
  write->add_option("VALUE", options->value, "A number, 0 or 1, or a text")
      ->type_name("")
      ->required();
  write->add_flag("-x,--hex-value", options->isHex, "VALUE are bytes: 02 41, STX 41 CR LF");
  write->add_flag("-j,--json", options->isJson, "What was done as a JSON object");
  AddInstanceAccess(write, &options->access, false);
  write->footer("Example: loka write '0?tx_token?string-20' R");
}

int RunWrite(WriteOptions* options) {
  std::string value = options->value;
  std::string error;
  if (options->isHex && !ParseControlText(options->value, &value, &error)) {
    TellUser(error);
    return static_cast<int>(ExitStatus::kUsage);
  }
  options->access.acknowledges = false;
  options->access.connects = false;
  Answer answer;
  const auto instance = OpenInstance(&options->access, &answer);
  if (instance == nullptr) {
    return TellAnswer(answer);
  }
  answer = instance->Call({{"op", "write"}, {"uri", options->uri}, {"value", CompactHex(value)}});
  if (answer.IsDone()) {
    std::string text;
    if (options->isJson) {
      nlohmann::json line = answer.data;
      line["uri"] = options->uri;
      text = JsonLine(line);
    } else {
      text = ResultOf(&answer);
    }
    if (!text.empty() && !WriteResult(text + "\n")) {
      return static_cast<int>(ExitStatus::kRefused);
    }
  }
  return EndOf(*instance, answer);
}
