// SPDX-License-Identifier: Apache-2.0
#include "host/commands/TagsCommand.h"

#include <CLI/CLI.hpp>

#include "host/commands/TextTable.h"
#include "host/events/JsonLine.h"
#include "host/text/ByteText.h"
#include "host/text/Output.h"
#include "host/text/Utf8Text.h"

namespace {

using Json = nlohmann::json;

// The bytes behind the hexadecimal digits; empty for a tag without a value.
std::string ValueOf(const Json& row) {
  std::string bytes;
  const auto found = row.find("value");
  if (found != row.end() && found->is_string()) {
    (void)ParseHexBytes(found->get<std::string>(), &bytes);
  }
  return bytes;
}

std::string Shown(const Json& row) {
  if (!row.contains("value")) {
    return "-";
  }
  const std::string refusal = row.value("refusal", "");
  return refusal.empty() ? EscapeBytes(ValueOf(row)) : "refused: " + PrintableUtf8(refusal);
}

std::string TableOf(const Json& rows) {
  std::vector<std::vector<std::string>> cells = {{"tag", "access", "value"}};
  for (const Json& row : rows) {
    cells.push_back({row.value("uri", ""), row.value("access", ""), Shown(row)});
  }
  return TextTable(cells);
}

std::string LinesOf(const Json& rows) {
  std::string text;
  for (const Json& row : rows) {
    nlohmann::ordered_json line = {{"uri", row.value("uri", "")},
                                   {"name", row.value("name", "")},
                                   {"access", row.value("access", "")}};
    const std::string refusal = row.value("refusal", "");
    if (!refusal.empty()) {
      line["refusal"] = refusal;
    } else if (row.contains("value")) {
      line["value"] = ValueOf(row);
      line["hex"] = row["value"];
    }
    text += JsonLine(line) + "\n";
  }
  return text;
}

}  // namespace

void AddTags(CLI::App* app, TagsOptions* options) {
  CLI::App* const tags = app->add_subcommand("tags", "List the memory types with their values");
  tags->add_flag("-j,--json", options->isJson, "One JSON object a tag");
  AddInstanceAccess(tags, &options->access);
  tags->footer("Example: loka tags -j");
}

int RunTags(TagsOptions* options) {
  options->access.acknowledges = false;
  options->access.connects = false;
  Answer answer;
  const auto instance = OpenInstance(&options->access, &answer);
  if (instance == nullptr) {
    return TellAnswer(answer);
  }
  answer = instance->Call({{"op", "tags"}});
  if (answer.IsDone()) {
    const Json rows = answer.data.value("rows", Json::array());
    if (!WriteResult(options->isJson ? LinesOf(rows) : TableOf(rows))) {
      answer.status = ExitStatus::kRefused;
    }
  }
  return EndOf(*instance, answer);
}
