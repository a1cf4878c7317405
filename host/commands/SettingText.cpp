// SPDX-License-Identifier: Apache-2.0
#include "host/commands/SettingText.h"

#include <algorithm>
#include <cstdint>
#include <nlohmann/json.hpp>

#include "host/instance/SettingTable.h"

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
