// SPDX-License-Identifier: Apache-2.0
// Every relative link and image of the documentation leads somewhere.
#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>
#include <set>
#include <string>
#include <vector>

#include "tests/docs/MarkdownText.h"

namespace {

namespace fs = std::filesystem;

const fs::path kProject = LOKA_SOURCE_DIR;

// The documents, as paths from the project's folder.
std::vector<std::string> Documents() {
  std::vector<std::string> documents;
  for (const auto& entry : fs::directory_iterator(kProject / "docs")) {
    if (entry.path().extension() == ".md") {
      documents.push_back("docs/" + entry.path().filename().string());
    }
  }
  EXPECT_GE(documents.size(), 3U);
  if (fs::exists(kProject / "README.md")) documents.emplace_back("README.md");
  return documents;
}

bool HasAnchor(const std::string& document, const std::string& anchor) {
  const MarkdownText text(document);
  const std::vector<std::string>& anchors = text.Anchors();
  return std::find(anchors.begin(), anchors.end(), anchor) != anchors.end();
}

TEST(LinksTest, EveryRelativeLinkResolves) {
  for (const std::string& document : Documents()) {
    const MarkdownText text(document);
    for (const std::string& link : text.Links()) {
      if (link.find("://") != std::string::npos) continue;
      const std::size_t hash = link.find('#');
      const std::string file = link.substr(0, hash);
      const fs::path target = file.empty()
                                  ? fs::path(document)
                                  : (fs::path(document).parent_path() / file).lexically_normal();
      ASSERT_FALSE(target.is_absolute()) << document << ": " << link;
      EXPECT_TRUE(fs::exists(kProject / target)) << document << ": " << link;
      if (hash != std::string::npos && fs::exists(kProject / target)) {
        EXPECT_TRUE(HasAnchor(target.string(), link.substr(hash + 1))) << document << ": " << link;
      }
    }
  }
}

TEST(LinksTest, TheManualsContentsNameEveryChapterInOrder) {
  const MarkdownText manual("docs/manual.md");
  std::vector<std::string> chapters;
  std::vector<std::string> contents;
  for (const std::string& line : manual.Lines()) {
    if (line.compare(0, 3, "## ") == 0) chapters.push_back(line.substr(3));
    const std::size_t begin = line.find(". [");
    if (begin != std::string::npos && begin <= 2) {
      contents.push_back(line.substr(begin + 3, line.find(']') - begin - 3));
    }
  }
  EXPECT_EQ(contents, chapters);
  EXPECT_GE(chapters.size(), 15U);
}

}  // namespace
