// SPDX-License-Identifier: Apache-2.0
#include "host/commands/TextTable.h"

#include <algorithm>
#include <cstddef>

namespace {

constexpr std::size_t kGap = 2;

std::vector<std::size_t> Widths(const std::vector<std::vector<std::string>>& rows) {
  std::vector<std::size_t> widths;
  for (const std::vector<std::string>& row : rows) {
    widths.resize(std::max(widths.size(), row.size()));
    for (std::size_t column = 0; column < row.size(); ++column) {
      widths[column] = std::max(widths[column], row[column].size());
    }
  }
  return widths;
}

}  // namespace

std::string TextTable(const std::vector<std::vector<std::string>>& rows) {
  const std::vector<std::size_t> widths = Widths(rows);
  std::string text;
  for (const std::vector<std::string>& row : rows) {
    std::string line;
    for (std::size_t column = 0; column < row.size(); ++column) {
      line += row[column];
      line.append(widths[column] + kGap - row[column].size(), ' ');
    }
    line.erase(line.find_last_not_of(' ') + 1);
    text += line + "\n";
  }
  return text;
}
