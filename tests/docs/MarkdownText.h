// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <utility>
#include <vector>

// A text file of the project, named from the project's folder. Fails the running test when it
// cannot be read.
std::string ReadProjectFile(const std::string& path);

// What stands between single backticks, in order.
std::vector<std::string> CodeSpans(const std::string& text);

// The only code span of a table cell; fails the running test when there is none or more than one.
std::string TheSpan(const std::string& cell);

// What of a Markdown file the tests look at: headings, tables, fenced blocks, code spans and links.
class MarkdownText {
 public:
  using Row = std::vector<std::string>;  // trimmed cells

  struct Table {
    Row header;
    std::vector<Row> rows;
    std::string heading;  // the heading above it
  };

  struct Block {
    std::string info;  // what stands behind the opening fence
    std::string text;
  };

  explicit MarkdownText(const std::string& path);

  const std::vector<Block>& Blocks() const { return blocks_; }

  // All tables whose first column has this heading. Fails the running test when there is none.
  std::vector<Table> Tables(const std::string& firstHeader) const;

  // All rows of these tables.
  std::vector<Row> Rows(const std::string& firstHeader) const;

  // The code spans outside of fenced blocks, table cells included.
  const std::vector<std::string>& Spans() const { return spans_; }

  // The lines outside of fenced blocks and tables.
  const std::vector<std::string>& Lines() const { return lines_; }

  // Link and image targets.
  const std::vector<std::string>& Links() const { return links_; }

  // The headings as link targets: "The token queue" is "the-token-queue".
  const std::vector<std::string>& Anchors() const { return anchors_; }

 private:
  void TakeTableLine(const std::string& line);
  void TakeHeading(const std::string& line);
  void TakeLinks(const std::string& line);

  bool inTable_ = false;
  std::string heading_;
  std::vector<Table> tables_;
  std::vector<Block> blocks_;
  std::vector<std::string> spans_;
  std::vector<std::string> lines_;
  std::vector<std::string> links_;
  std::vector<std::string> anchors_;
};
