// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <nlohmann/json_fwd.hpp>
#include <string>
#include <vector>

// What the commands say about settings that were staged or applied. Any thread.

// A setting as a request answered it: {"key", "value", "active"} when staged, {"key", "value",
// "previous"} when applied.
using SettingRows = std::vector<nlohmann::json>;

// "staged: baud 19200 (active 9600), rx_suffix 0D0A (active 03)", in the order of kSettingTable.
std::string StagedText(SettingRows rows);

// What "done" did, from its data: "applied and stored; 1 waiting token cleared".
std::string AppliedText(const nlohmann::json& data);

// "baud 19200 (was 9600)" for each applied setting whose key is not in `expected`; empty for none.
std::string AlsoAppliedText(const nlohmann::json& data, const std::vector<std::string>& expected);

// A heading and a line a setting, from the rows of the request "settings": configured, active,
// staged and stored value.
std::string SettingsTable(const SettingRows& rows);

// One hint for each of these rows whose value in effect was set on the driver's console.
void AddConsoleHints(const SettingRows& rows, std::vector<std::string>* hints);
