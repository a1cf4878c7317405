// SPDX-License-Identifier: Apache-2.0
#include "host/events/JsonLine.h"

#include <nlohmann/json.hpp>

namespace {

constexpr int kOneLine = -1;

}  // namespace

std::string JsonLine(const nlohmann::json& json) {
  return json.dump(kOneLine, ' ', true, nlohmann::json::error_handler_t::replace);
}

std::string JsonLine(const nlohmann::ordered_json& json) {
  return json.dump(kOneLine, ' ', true, nlohmann::ordered_json::error_handler_t::replace);
}
