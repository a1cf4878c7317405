// SPDX-License-Identifier: Apache-2.0
#include "host/commands/SettingText.h"

#include <algorithm>
#include <cstdint>
#include <nlohmann/json.hpp>

#include "host/commands/TextTable.h"
#include "host/instance/SettingTable.h"
#include "host/text/Utf8Text.h"

namespace {

using Json = nlohmann::json;

std::ptrdiff_t PlaceOf(const Json& row) {
  const SettingEntry* const setting = FindSetting(row.value("key", ""));
  return setting == nullptr ? static_cast<std::ptrdiff_t>(kSettingTable.size())
                            : setting - kSettingTable.data();
}

void Append(const std::string& part, std::string* text) {
  *text += (text->empty() ? "" : ", ") + part;
}

std::string Describe(const Json& row, const char* formerKey, const char* formerWord) {
  return row.value("key", "") + " " + row.value("value", "") + " (" + formerWord + " " +
         row.value(formerKey, "") + ")";
}

std::string Cell(const Json& row, const char* key) {
  return row.contains(key) ? PrintableUtf8(row.value(key, "")) : "-";
}

}  // namespace

std::string StagedText(SettingRows rows) {
  std::stable_sort(rows.begin(), rows.end(),
                   [](const Json& a, const Json& b) { return PlaceOf(a) < PlaceOf(b); });
  std::string text;
  for (const Json& row : rows) {
    Append(Describe(row, "active", "active"), &text);
  }
  return "staged: " + text;
}

std::string AppliedText(const Json& data) {
  std::string text =
      data.value("applied", Json::array()).empty() ? "nothing was staged" : "applied";
  if (text == "applied") {
    text += data.value("stored", false) ? " and stored" : ", not stored";
  }
  const auto cleared = data.value("cleared", std::uint64_t{0});
  if (cleared > 0) {
    text += "; " + std::to_string(cleared) +
            (cleared == 1 ? " waiting token cleared" : " waiting tokens cleared");
  }
  return text;
}

std::string AlsoAppliedText(const Json& data, const std::vector<std::string>& expected) {
  std::string text;
  for (const Json& row : data.value("applied", Json::array())) {
    if (std::find(expected.begin(), expected.end(), row.value("key", "")) == expected.end()) {
      Append(Describe(row, "previous", "was"), &text);
    }
  }
  return text;
}

std::string SettingsTable(const SettingRows& rows) {
  std::vector<std::vector<std::string>> cells = {
      {"setting", "configured", "active", "staged", "stored"}};
  for (const Json& row : rows) {
    cells.push_back({Cell(row, "key"), Cell(row, "configured"), Cell(row, "active"),
                     Cell(row, "staged"), Cell(row, "stored")});
  }
  return TextTable(cells);
}

void AddConsoleHints(const SettingRows& rows, std::vector<std::string>* hints) {
  for (const Json& row : rows) {
    if (row.contains("console")) {
      hints->push_back(row.value("key", "") + " " + row.value("console", "") +
                       ", set on the console, is in effect until SP_Done or a restart");
    }
  }
}
