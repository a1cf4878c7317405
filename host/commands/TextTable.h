// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

// Rows as lines with aligned columns, two blanks between, no blanks at the end. The first row is
// the heading. Any thread.
std::string TextTable(const std::vector<std::vector<std::string>>& rows);
