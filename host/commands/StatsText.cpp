// SPDX-License-Identifier: Apache-2.0
#include "host/commands/StatsText.h"

#include <cstdint>
#include <nlohmann/json.hpp>

namespace {

std::string CountText(const nlohmann::json& data, const char* key) {
  return std::to_string(data.value(key, std::uint64_t{0}));
}

}  // namespace

std::string StatsText(const nlohmann::json& data) {
  std::string drops;
  std::uint64_t dropCount = 0;
  for (const auto& [reason, count] : data.at("drops").items()) {
    drops +=
        (drops.empty() ? "" : ", ") + reason + " " + std::to_string(count.get<std::uint64_t>());
    dropCount += count.get<std::uint64_t>();
  }
  std::string text = "tokens " + CountText(data, "tokens");
  text += "  dropped " + std::to_string(dropCount) + (drops.empty() ? "" : " (" + drops + ")");
  if (data.value("missed_bytes", std::uint64_t{0}) > 0) {
    text += "  missed bytes " + CountText(data, "missed_bytes");
  }
  if (data.contains("line_errors")) {
    const nlohmann::json& errors = data["line_errors"];
    text += "  framing errors " + CountText(errors, "framing");
    text += "  parity errors " + CountText(errors, "parity");
    text += "  overruns " + CountText(errors, "overruns");
  }
  text += "  lost sends " + CountText(data, "lost_sends");
  text += "  reconnects " + CountText(data, "reconnects");
  text += "  findings " + CountText(data, "findings");
  return text;
}
