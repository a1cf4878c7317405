// SPDX-License-Identifier: Apache-2.0
// The manual's tables of error texts against the texts that stand in the sources.
#include <gtest/gtest.h>

#include <algorithm>
#include <map>
#include <regex>
#include <set>

#include "protlib/ErrorState.h"
#include "tests/docs/MarkdownText.h"
#include "tests/docs/SourceText.h"

namespace {

using Row = MarkdownText::Row;

const std::string kVarying = "…";
const char* const kNoText = "*(no text)*";

// Generic sources that raise errors; of their literals those with a blank are texts.
const char* const kGenericSources[] = {
    "protlib/ProtocolBase.cpp", "protlib/ProtocolBase_Access.cpp", "protlib/ErrorState.cpp",
    "protlib/TagBase.cpp",      "protlib/TagBase_Convert.cpp",     "protlib/CfgParserN.cpp",
    "factory/ProtModule.cpp"};

bool HasBlank(const std::string& text) {
  return text.find(' ') != std::string::npos && text.find_first_not_of(" \t") != std::string::npos;
}

// Whether the text is one literal or several in a row.
bool IsMadeOf(const std::string& text, const std::set<std::string>& literals) {
  if (text.empty()) return true;
  return std::any_of(literals.begin(), literals.end(), [&](const std::string& literal) {
    return text.compare(0, literal.size(), literal) == 0 &&
           IsMadeOf(text.substr(literal.size()), literals);
  });
}

// The pieces between the varying parts.
std::vector<std::string> Pieces(const std::string& text) {
  std::vector<std::string> pieces;
  std::size_t begin = 0;
  for (std::size_t at = 0; (at = text.find(kVarying, begin)) != std::string::npos;
       begin = at + kVarying.size()) {
    pieces.push_back(text.substr(begin, at - begin));
  }
  pieces.push_back(text.substr(begin));
  return pieces;
}

std::string WithoutVarying(const std::string& text) {
  std::string joined;
  for (const std::string& piece : Pieces(text)) joined += piece;
  return joined;
}

// The headers of texts hold constants only: every text has a name by which the tests find it.
TEST(ManualSourcesTest, EveryTextInTheHeadersHasAName) {
  for (const char* header :
       {"driver/Texts_LOKA.h", "driver/ConsoleTexts_LOKA.h", "protlib/ConsoleTexts.h",
        "driver/ConfigKeys.h", "driver/ParameterNames.h"}) {
    EXPECT_EQ(ConstantsOf(header).size(), LiteralsOf(header).size()) << header;
    EXPECT_GT(ConstantsOf(header).size(), 5U) << header;
  }
}

class ManualTextsTest : public ::testing::Test {
 protected:
  void SetUp() override {
    for (const Row& row : MarkdownText("docs/manual.md").Rows("Text")) {
      if (row[0] == kNoText) continue;
      const std::string text = TheSpan(row[0]);
      EXPECT_TRUE(codes_.emplace(text, row[1]).second) << "twice in the manual: " << text;
      EXPECT_FALSE(row[2].empty() || row[3].empty()) << "no cause or no cure: " << text;
    }
    for (const char* source : kGenericSources) {
      for (const std::string& literal : LiteralsOf(source)) {
        if (HasBlank(literal)) generic_.insert(literal);
      }
    }
    EXPECT_GT(generic_.size(), 20U);
  }

  std::map<std::string, std::string> codes_;  // text in the manual to its code there
  std::set<std::string> generic_;
  const std::map<std::string, std::string> own_ = ConstantsOf("driver/Texts_LOKA.h");
};

TEST_F(ManualTextsTest, EveryTextOfTheDriverHasARow) {
  EXPECT_GT(own_.size(), 30U);
  for (const auto& [name, text] : own_) {
    EXPECT_EQ(std::count_if(
                  codes_.begin(), codes_.end(),
                  [&text = text](const auto& row) { return WithoutVarying(row.first) == text; }),
              1)
        << name << ": " << text;
  }
}

TEST_F(ManualTextsTest, EveryGenericTextIsInARow) {
  for (const std::string& text : generic_) {
    EXPECT_TRUE(
        std::any_of(codes_.begin(), codes_.end(),
                    [&](const auto& row) { return row.first.find(text) != std::string::npos; }))
        << "\"" << text << "\"";
  }
}

TEST_F(ManualTextsTest, EveryRowIsATextOfTheCode) {
  std::set<std::string> literals = generic_;
  for (const auto& [name, text] : own_) literals.insert(text);
  for (const auto& [text, code] : codes_) {
    for (const std::string& piece : Pieces(text)) EXPECT_TRUE(IsMadeOf(piece, literals)) << text;
  }
}

TEST_F(ManualTextsTest, TheCodesAreThoseRecorded) {
  const std::map<std::string, int> values = {{"kGeneralError", kGeneralError},
                                             {"kNotPossibleNow", kNotPossibleNow},
                                             {"kConversionError", kConversionError}};
  const std::regex recorded(R"re(SetError\((k\w+),\s*(Texts_LOKA::(k\w+)|"([^"]*)"|(k\w+))\))re");
  int count = 0;
  for (const std::string& source : DriverSources()) {
    const std::string code = ReadProjectFile(source);
    for (std::sregex_iterator at(code.begin(), code.end(), recorded), end; at != end; ++at) {
      const std::smatch& match = *at;
      std::string text = match[4];
      if (match[3].matched) text = own_.at(match[3]);
      if (match[5].matched) text = ConstantsOf(source).at(match[5]);
      ASSERT_EQ(codes_.count(text), 1U) << text;
      EXPECT_EQ(codes_.at(text), std::to_string(values.at(match[1]))) << text;
      ++count;
    }
  }
  EXPECT_GE(count, 15);
}

// Whatever else looks like a text (it holds a blank) stands in the manual, too: in a code span or
// an example. So a text that is raised somewhere new does not go unnoticed.
TEST_F(ManualTextsTest, NoTextOfTheSourcesIsMissing) {
  const MarkdownText manual("docs/manual.md");
  std::string said;
  for (const std::string& span : manual.Spans()) said += span + "\n";
  for (const MarkdownText::Block& block : manual.Blocks()) said += block.text;
  for (const Row& row : manual.Rows("Memory type")) said += row[1] + "\n";
  for (const std::string& source : DriverSources()) {
    // What it says ends a debug build, in front of the people who work on the driver.
    if (source == "protlib/LockOrder.cpp") continue;
    for (const std::string& literal : LiteralsOf(source)) {
      if (!HasBlank(literal) || literal.find('\n') != std::string::npos) continue;
      EXPECT_NE(said.find(literal), std::string::npos) << source << ": \"" << literal << "\"";
    }
  }
}

}  // namespace
