// SPDX-License-Identifier: Apache-2.0
#include "tests/docs/MarkdownText.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cctype>
#include <fstream>
#include <regex>
#include <sstream>

namespace {

constexpr const char* kFence = "```";

std::string Trimmed(const std::string& text) {
  const std::size_t first = text.find_first_not_of(' ');
  return first == std::string::npos ? ""
                                    : text.substr(first, text.find_last_not_of(' ') - first + 1);
}

bool StartsWith(const std::string& text, const std::string& start) {
  return text.compare(0, start.size(), start) == 0;
}

// "| a | b |" as its cells.
MarkdownText::Row CellsOf(const std::string& line) {
  MarkdownText::Row cells;
  std::istringstream stream(line.substr(1, line.find_last_of('|') - 1));
  for (std::string cell; std::getline(stream, cell, '|');) cells.push_back(Trimmed(cell));
  return cells;
}

bool IsRule(const std::string& line) { return line.find_first_not_of("|-: ") == std::string::npos; }

}  // namespace

std::string ReadProjectFile(const std::string& path) {
  std::ifstream file(std::string(LOKA_SOURCE_DIR) + "/" + path, std::ios::binary);
  EXPECT_TRUE(file) << "cannot read " << path;
  std::ostringstream text;
  text << file.rdbuf();
  return text.str();
}

std::vector<std::string> CodeSpans(const std::string& text) {
  std::vector<std::string> spans;
  for (std::size_t begin = text.find('`'); begin != std::string::npos;) {
    const std::size_t end = text.find('`', begin + 1);
    if (end == std::string::npos) break;
    spans.push_back(text.substr(begin + 1, end - begin - 1));
    begin = text.find('`', end + 1);
  }
  return spans;
}

std::string TheSpan(const std::string& cell) {
  const std::vector<std::string> spans = CodeSpans(cell);
  EXPECT_EQ(spans.size(), 1U) << "one code span expected in: " << cell;
  return spans.empty() ? "" : spans.front();
}

MarkdownText::MarkdownText(const std::string& path) {
  std::istringstream stream(ReadProjectFile(path));
  bool inBlock = false;
  for (std::string line; std::getline(stream, line);) {
    if (StartsWith(line, kFence)) {
      inBlock = !inBlock;
      if (inBlock) blocks_.push_back({line.substr(3), ""});
    } else if (inBlock) {
      blocks_.back().text += line + "\n";
    } else {
      for (std::string& span : CodeSpans(line)) spans_.push_back(std::move(span));
      TakeLinks(line);
      if (StartsWith(line, "|")) {
        TakeTableLine(line);
        continue;
      }
      inTable_ = false;
      lines_.push_back(line);
      if (StartsWith(line, "#")) TakeHeading(line);
    }
  }
  EXPECT_FALSE(inBlock) << "a fence is not closed in " << path;
}

void MarkdownText::TakeTableLine(const std::string& line) {
  if (!inTable_) {
    inTable_ = true;
    tables_.push_back({CellsOf(line), {}, heading_});
  } else if (!IsRule(line)) {
    Table& table = tables_.back();
    table.rows.push_back(CellsOf(line));
    EXPECT_EQ(table.rows.back().size(), table.header.size()) << line;
  }
}

void MarkdownText::TakeHeading(const std::string& line) {
  heading_ = Trimmed(line.substr(line.find_first_not_of('#')));
  std::string anchor;
  for (const char c : heading_) {
    const auto character = static_cast<unsigned char>(c);
    if (c == ' ') {
      anchor += '-';
    } else if (std::isalnum(character) != 0 || c == '-' || c == '_') {
      anchor += static_cast<char>(std::tolower(character));
    }
  }
  anchors_.push_back(anchor);
}

void MarkdownText::TakeLinks(const std::string& line) {
  static const std::regex kLink(R"(\]\(([^)\s]+)\))");
  for (std::sregex_iterator at(line.begin(), line.end(), kLink), end; at != end; ++at) {
    links_.push_back((*at)[1]);
  }
}

std::vector<MarkdownText::Table> MarkdownText::Tables(const std::string& firstHeader) const {
  std::vector<Table> found;
  std::copy_if(tables_.begin(), tables_.end(), std::back_inserter(found),
               [&](const Table& table) { return table.header.front() == firstHeader; });
  EXPECT_FALSE(found.empty()) << "no table begins with the column " << firstHeader;
  return found;
}

std::vector<MarkdownText::Row> MarkdownText::Rows(const std::string& firstHeader) const {
  std::vector<Row> rows;
  for (const Table& table : Tables(firstHeader)) {
    rows.insert(rows.end(), table.rows.begin(), table.rows.end());
  }
  return rows;
}
