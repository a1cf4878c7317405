// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <utility>
#include <variant>

// A value of the permanent storage: yes or no, a number, or a text of any bytes but zero.
using StoredValue = std::variant<bool, int, std::string>;

// Key space (a protocol's identifier) and key.
using StoredKey = std::pair<std::string, std::string>;
