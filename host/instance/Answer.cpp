// SPDX-License-Identifier: Apache-2.0
#include "host/instance/Answer.h"

nlohmann::json ToJson(const Answer& answer) {
  return {{"ok", answer.IsDone()}, {"status", static_cast<int>(answer.status)},
          {"text", answer.text},   {"code", answer.errorCode},
          {"hints", answer.hints}, {"data", answer.data}};
}

bool FromJson(const nlohmann::json& json, Answer* answer) {
  try {
    Answer read;
    read.status = static_cast<ExitStatus>(json.at("status").get<int>());
    read.text = json.at("text").get<std::string>();
    read.errorCode = json.at("code").get<int>();
    read.hints = json.at("hints").get<std::vector<std::string>>();
    read.data = json.at("data");
    if (json.at("ok").get<bool>() != read.IsDone()) {
      return false;
    }
    *answer = std::move(read);
    return true;
  } catch (const nlohmann::json::exception&) {
    return false;
  }
}
