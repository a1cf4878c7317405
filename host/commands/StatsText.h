// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <nlohmann/json_fwd.hpp>
#include <string>

// The data of the request "stats" as one line for people: "tokens 3  dropped 1 (no-suffix 1)  ...".
// Any thread.
std::string StatsText(const nlohmann::json& data);
