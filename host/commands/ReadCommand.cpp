// SPDX-License-Identifier: Apache-2.0
#include "host/commands/ReadCommand.h"

#include <CLI/CLI.hpp>

#include "host/events/JsonLine.h"
#include "host/text/ByteText.h"
#include "host/text/Output.h"

namespace {

using OrderedJson = nlohmann::ordered_json;

// A refusal is told on standard error as well; here it keeps the lines complete for a script that
// counts them.
std::string JsonText(const std::string& uri, const Answer& answer, const std::string& bytes) {
  OrderedJson line = {{"uri", uri}};
  if (answer.IsDone()) {
    line["value"] = bytes;
    line["hex"] = CompactHex(bytes);
  } else {
    line["error"] = answer.errorCode;
    line["text"] = answer.text;
  }
  if (!answer.hints.empty()) {
    line["hints"] = answer.hints;
  }
  return JsonLine(line);
}

std::string LineOf(const ReadOptions& options, const std::string& uri, const Answer& answer) {
  std::string bytes;
  if (answer.IsDone()) {
    (void)ParseHexBytes(answer.data.value("value", ""), &bytes);
  }
  if (options.isJson) {
    return JsonText(uri, answer, bytes);
  }
  return options.isHex ? HexBytes(bytes) : EscapeBytes(bytes);
}

}  // namespace

void AddRead(CLI::App* app, ReadOptions* options) {
  CLI::App* const read = app->add_subcommand("read", "Print the values of tags");
  read->add_option("URI", options->uris, "Tag: NODE?MEMORYTYPE?DATATYPE")
      ->type_name("")
      ->required();
  CLI::Option* const json = read->add_flag("-j,--json", options->isJson, "One JSON object a tag");
  read->add_flag("-x,--hex-output", options->isHex, "Characters of the value as hexadecimal")
      ->excludes(json);
  AddInstanceAccess(read, &options->access, false);
  read->footer("Example: loka read '0?tokens_available?unsignedInt' '0?rx_token?string-64'");
}

int RunRead(ReadOptions* options) {
  options->access.acknowledges = false;
  options->access.connects = false;
  Answer answer;
  const auto instance = OpenInstance(&options->access, &answer);
  if (instance == nullptr) {
    return TellAnswer(answer);
  }
  int status = 0;
  for (const std::string& uri : options->uris) {
    answer = instance->Call({{"op", "read"}, {"uri", uri}});
    if ((answer.IsDone() || options->isJson) &&
        !WriteResult(LineOf(*options, uri, answer) + "\n")) {
      return static_cast<int>(ExitStatus::kRefused);
    }
    const int end = EndOf(*instance, answer);
    status = status == 0 ? end : status;
    if (instance->StopSignal() != 0) {
      break;
    }
  }
  return status;
}
