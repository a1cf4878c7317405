// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <nlohmann/json.hpp>
#include <string>
#include <utility>
#include <vector>

#include "host/base/ExitStatus.h"

// How a request to an instance went, in this process or in another one.
struct Answer {
  ExitStatus status = ExitStatus::kDone;
  std::string text;   // what was refused and why, in the driver's words where it has some
  int errorCode = 0;  // the driver's number for that; 0 where the refusal is not the driver's
  std::vector<std::string> hints;  // what to know or to do, one line each; also behind a success
  nlohmann::json data = nlohmann::json::object();  // what was asked for, by name

  bool IsDone() const { return status == ExitStatus::kDone; }
};

inline Answer Refusal(std::string text, ExitStatus status = ExitStatus::kRefused) {
  Answer answer;
  answer.status = status;
  answer.text = std::move(text);
  return answer;
}

// Both ways for the control socket: {"ok", "status", "text", "code", "hints", "data"}.
nlohmann::json ToJson(const Answer& answer);

// False for anything that ToJson does not write.
bool FromJson(const nlohmann::json& json, Answer* answer);
