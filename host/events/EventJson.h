// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <nlohmann/json_fwd.hpp>
#include <string>

#include "host/events/HostEvent.h"

// Events as JSON objects. Their keys are a promise to scripts and are listed in the manual page:
//
//   all       t (UTC, microseconds), ev, port
//   rx        hex
//   tx        hex, sent (bytes that the line took)
//   token     n, len, text, hex, waiting, dur_us and frame (when known), cut (only when true)
//   drop      why, hex, after_ms (only behind a silence)
//   port      state, errno (only when there is one), text
//   setting   state, key, value, previous (only when known)
//   console   command, ok, text
//   note      text
//   finding   text, driver, model (both hex)
//
// `hex` holds upper-case digits without blanks and is exact. `text` is the same bytes for reading:
// what is not valid UTF-8 is replaced. All functions: any thread.

nlohmann::json ToJson(const HostEvent& event);

// One line without its line end, plain ASCII whatever the device sent, keys in the order above.
std::string ToJsonLine(const HostEvent& event);

// Reads what ToJson writes. False for anything else.
bool FromJson(const nlohmann::json& json, HostEvent* event);
