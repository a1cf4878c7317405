// SPDX-License-Identifier: Apache-2.0
// The manual's chapter on the configuration text against the parser.
#include <gtest/gtest.h>

#include <array>
#include <map>
#include <set>

#include "driver/ParamManager.h"
#include "driver/SerialSettings.h"
#include "tests/docs/DriverInUse.h"
#include "tests/docs/MarkdownText.h"
#include "tests/docs/SourceText.h"

namespace {

using Row = MarkdownText::Row;

const char* const kHead = "CfgVer=1";

class ManualConfigTest : public ::testing::Test {
 protected:
  // The configuration with only the keys that the manual calls required, without `leftOut`.
  std::string RequiredKeys(const std::string& leftOut = "") const {
    static const std::map<std::string, std::string> kSomeValue = {
        {"model", "1"}, {"port", "com1"},  {"baudrate", "9600"}, {"parity", "even"},
        {"bits", "8"},  {"stopbits", "1"}, {"mode", "RS-232"}};
    std::string text = kHead;
    for (const Row& row : keys_) {
      const std::string key = TheSpan(row[0]);
      if (row[4] == "yes" && key != leftOut) text += " " + key + "=" + kSomeValue.at(key);
    }
    return text;
  }

  static std::string ErrorOf(const std::string& configuration) {
    return DriverInUse().Config(configuration);
  }

  // A text directly behind the head of a configuration, where it wins.
  static std::string Overridden(const std::string& configuration, const std::string& by) {
    return kHead + (" " + by + " ") + configuration.substr(std::string(kHead).size());
  }

  const MarkdownText manual_{"docs/manual.md"};
  const std::vector<Row> keys_ = manual_.Rows("Key");
};

TEST_F(ManualConfigTest, TheKeysAreThoseOfTheCode) {
  std::multiset<std::string> inManual;
  for (const Row& row : keys_) inManual.insert(TheSpan(row[0]));
  std::multiset<std::string> inCode;
  for (const auto& [name, key] : ConstantsOf("driver/ConfigKeys.h")) inCode.insert(key);
  EXPECT_EQ(inManual, inCode);
}

TEST_F(ManualConfigTest, TheDefaultsAreThoseOfTheParser) {
  _LOKA::ParamManager params;
  ASSERT_TRUE(params.parse(RequiredKeys().c_str())) << params.getLastError();
  const _LOKA::CommonParams& common = *params.getCommonParams();
  const auto word = [](bool value) { return std::string(value ? "true" : "false"); };
  const std::map<std::string, std::string> defaults = {
      {"rx_prefix", common.rx_prefix},
      {"rx_suffix", common.rx_suffix},
      {"gap", std::to_string(common.gap)},
      {"tx_prefix", common.tx_prefix},
      {"tx_suffix", common.tx_suffix},
      {"hex_tokens", word(common.hex_tokens)},
      {"token_queue_size", std::to_string(common.token_queue_size)},
      {"autoConnect", word(common.autoConnect)}};
  for (const Row& row : keys_) {
    const auto found = defaults.find(TheSpan(row[0]));
    if (found == defaults.end()) {
      EXPECT_EQ(row[3], "none") << row[0];
    } else {
      EXPECT_EQ(row[3], found->second.empty() ? "empty" : "`" + found->second + "`") << row[0];
    }
  }
}

TEST_F(ManualConfigTest, TheRequiredKeysAreRequiredAndTheOthersAreNot) {
  EXPECT_EQ(ErrorOf(RequiredKeys()), "");
  for (const Row& row : keys_) {
    ASSERT_TRUE(row[4] == "yes" || row[4] == "no") << row[0];
    if (row[4] == "yes") {
      EXPECT_NE(ErrorOf(RequiredKeys(TheSpan(row[0]))), "") << row[0];
    }
  }
}

// Each key is left out and given values that no key, or not every key, takes.
TEST_F(ManualConfigTest, EachKeysMessagesAreThoseOfTheDriver) {
  for (const Row& row : keys_) {
    const std::string key = TheSpan(row[0]);
    std::set<std::string> messages;
    messages.insert(ErrorOf(RequiredKeys(key)));
    for (const char* value : {"", "0", "5", "10001", "0g", "space", "RS-485P", "TRUE", "mark"}) {
      messages.insert(ErrorOf(Overridden(RequiredKeys(), key + "=" + value)));
    }
    messages.erase("");
    std::set<std::string> inManual;
    for (const std::string& message : CodeSpans(row[5])) inManual.insert(message);
    EXPECT_EQ(inManual, messages) << key;
  }
}

TEST_F(ManualConfigTest, TheWordsNamedAsValuesAreAccepted) {
  for (const Row& row : keys_) {
    for (const std::string& value : CodeSpans(row[2])) {
      const std::string text = Overridden(RequiredKeys(), TheSpan(row[0]) + "=" + value);
      EXPECT_EQ(ErrorOf(text), "") << text;
    }
  }
}

TEST_F(ManualConfigTest, TheQueueSizesAreThoseOfTheParser) {
  const std::string range = std::to_string(_LOKA::CommonParams::kSmallestTokenQueueSize) + " to " +
                            std::to_string(_LOKA::CommonParams::kLargestTokenQueueSize);
  for (const Row& row : keys_) {
    if (TheSpan(row[0]) == "token_queue_size") {
      EXPECT_EQ(row[2], range);
    }
  }
  EXPECT_EQ(manual_.Rows("What").at(1).at(1), range);
}

TEST_F(ManualConfigTest, EveryExampleIsAccepted) {
  int count = 0;
  for (const MarkdownText::Block& block : manual_.Blocks()) {
    if (block.info != "config") continue;
    EXPECT_EQ(ErrorOf(block.text), "") << block.text;
    ++count;
  }
  EXPECT_GE(count, 9);
}

TEST_F(ManualConfigTest, EveryWrongExampleIsRefusedWithItsMessage) {
  std::string first;
  for (const MarkdownText::Block& block : manual_.Blocks()) {
    if (first.empty() && block.info == "config") first = block.text;
  }
  for (const Row& row : manual_.Rows("Wrong configuration")) {
    const std::string wrong = TheSpan(row[0]);
    const bool isWhole = wrong.compare(0, 7, "CfgVer=") == 0;
    EXPECT_EQ(ErrorOf(isWhole ? wrong : Overridden(first, wrong)), TheSpan(row[1])) << wrong;
  }
}

TEST_F(ManualConfigTest, TheSyntaxIsAsSaid) {
  _LOKA::ParamManager params;
  const std::string text = RequiredKeys("port") +
                           " token_queue_size=0x10 gap=010ms Node3::port=com9 Node3::model=other "
                           "port=my&nbsp;port port=com2\trx_sufix=0D\nrx_prefix=";
  ASSERT_TRUE(params.parse(text.c_str())) << params.getLastError();
  const _LOKA::CommonParams& common = *params.getCommonParams();
  EXPECT_EQ(common.token_queue_size, 16);
  EXPECT_EQ(common.gap, 8);
  EXPECT_EQ(common.port, "my port");
  EXPECT_EQ(common.rx_suffix, "");
  EXPECT_EQ(params.getNodeParams(3)->model, "other");
  EXPECT_EQ(params.getNodeParams(4)->model, "1");
  EXPECT_EQ(ErrorOf("CfgVer=12 " + RequiredKeys().substr(std::string(kHead).size())), "");
}

// The two tables on parity and mode.
class ManualCodesTest : public ::testing::Test {
 protected:
  // The words that the description document offers for a parameter.
  static std::set<std::string> Offered(const std::string& parameter) {
    const std::string document = ReadProjectFile("driver/Xml_LOKA.xml");
    const std::size_t begin = document.find(">" + parameter + "<list_entry>");
    EXPECT_NE(begin, std::string::npos) << parameter;
    const std::string part = document.substr(begin, document.find("</parameter>", begin) - begin);
    const std::string open = "<list_entry>";
    std::set<std::string> words;
    for (std::size_t at = part.find(open); at != std::string::npos; at = part.find(open, at + 1)) {
      const std::size_t word = at + open.size();
      words.insert(part.substr(word, part.find('<', word) - word));
    }
    return words;
  }

  static const char* YesNo(bool yes) { return yes ? "yes" : "no"; }

  const MarkdownText manual_{"docs/manual.md"};
};

TEST_F(ManualCodesTest, Parity) {
  const std::vector<Row> rows = manual_.Rows("Parity");
  const std::set<std::string> offered = Offered("parity");
  int code = 0;
  for (const Row& row : rows) {
    EXPECT_EQ(row[1], std::to_string(code));
    const std::optional<int> configured = ParityFromConfig(row[0]);
    EXPECT_EQ(row[2], YesNo(configured.has_value())) << row[0];
    EXPECT_EQ(configured.value_or(code), code) << row[0];
    EXPECT_EQ(row[3], YesNo(IsParityCode(code))) << row[0];
    EXPECT_EQ(row[4], YesNo(offered.count(row[0]) != 0)) << row[0];
    EXPECT_EQ(TheSpan(row[5]), ParityName(code)) << row[0];
    ++code;
  }
  // The next code is none that has a name, or that may be written.
  EXPECT_FALSE(IsParityCode(code));
  EXPECT_STREQ(ParityName(code), "none");
}

TEST_F(ManualCodesTest, Mode) {
  const std::vector<Row> rows = manual_.Rows("Mode");
  const std::set<std::string> offered = Offered("mode");
  int code = 0;
  for (const Row& row : rows) {
    EXPECT_EQ(row[1], std::to_string(code));
    const std::optional<int> configured = ModeFromConfig(row[0]);
    EXPECT_EQ(row[2], YesNo(configured.has_value())) << row[0];
    EXPECT_EQ(configured.value_or(code), code) << row[0];
    EXPECT_EQ(row[3], YesNo(IsSettableMode(code))) << row[0];
    EXPECT_EQ(row[4], YesNo(offered.count(row[0]) != 0)) << row[0];
    EXPECT_EQ(TheSpan(row[5]), ModeName(code)) << row[0];
    ++code;
  }
  EXPECT_FALSE(IsSettableMode(code));
  EXPECT_STREQ(ModeName(code), "RS-232");
}

TEST_F(ManualCodesTest, WhatTheHostIsShown) {
  DriverInUse use;
  ASSERT_EQ(use.Config("CfgVer=1 model=1 port=com7 baudrate=300 parity=mark bits=7 stopbits=2 "
                       "mode=RS-422"),
            "");
  std::array<char, 100> text{};
  ASSERT_EQ(use.Driver().vcsGetComParams(text.data(), static_cast<int>(text.size())), 1);
  EXPECT_STREQ(text.data(), "com7,300,mark,7,2,RS-422");
}

}  // namespace
