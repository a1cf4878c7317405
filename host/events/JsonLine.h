// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <nlohmann/json_fwd.hpp>
#include <string>

// JSON as the program writes it everywhere: one line without its line end, plain ASCII, bytes that
// are not UTF-8 replaced, so that no byte of a device can harm a reader. Any thread.
std::string JsonLine(const nlohmann::json& json);
std::string JsonLine(const nlohmann::ordered_json& json);
