// SPDX-License-Identifier: Apache-2.0
// The manual's chapter on the diagnostic console against the driver.
#include <gtest/gtest.h>

#include <regex>
#include <set>
#include <sstream>

#include "driver/ConsoleTexts_LOKA.h"
#include "driver/Texts_LOKA.h"
#include "protlib/ConsoleTexts.h"
#include "tests/docs/DriverInUse.h"
#include "tests/docs/MarkdownText.h"
#include "tests/docs/SourceText.h"

namespace {

using Row = MarkdownText::Row;

std::string WithoutLineEnd(std::string text) {
  if (!text.empty() && text.back() == '\n') text.pop_back();
  return text;
}

// What stands in front of " - " in each line of a help text.
std::multiset<std::string> CommandsIn(const std::string& help) {
  std::multiset<std::string> commands;
  std::istringstream stream(help);
  for (std::string line; std::getline(stream, line);) {
    std::string command = line.substr(0, line.find(" - "));
    command.resize(command.find_last_not_of(' ') + 1);
    commands.insert(command);
  }
  return commands;
}

class ManualConsoleTest : public ::testing::Test {
 protected:
  const MarkdownText manual_{"docs/manual.md"};
};

TEST_F(ManualConsoleTest, TheCommandsAreThoseOfTheHelpTexts) {
  std::multiset<std::string> inManual;
  for (const Row& row : manual_.Rows("Command")) inManual.insert(TheSpan(row[0]));
  std::multiset<std::string> inCode = CommandsIn(ConsoleTexts::kHelp);
  inCode.merge(CommandsIn(ConsoleTexts_LOKA::kHelp));
  inCode.insert("deletetags");  // works, but no help text names it
  EXPECT_EQ(inManual, inCode);
}

TEST_F(ManualConsoleTest, TheCommandsAreThoseThatTheCodeTests) {
  std::set<std::string> inManual;
  for (const Row& row : manual_.Rows("Command")) {
    const std::string command = TheSpan(row[0]);
    inManual.insert(command.substr(0, command.find(' ')));
  }
  const std::string generic = ReadProjectFile("protlib/ProtocolBase_Console.cpp");
  const std::string own = ReadProjectFile("driver/Protocol_LOKA_Console.cpp");
  const std::regex tested(R"re(name == "(\w+)")re");
  const std::regex handled(R"re(\{("(\w+)"|kPutCommand), &Protocol_LOKA::Command)re");
  std::set<std::string> inCode;
  for (std::sregex_iterator at(generic.begin(), generic.end(), tested), end; at != end; ++at) {
    inCode.insert((*at)[1]);
  }
  for (std::sregex_iterator at(own.begin(), own.end(), handled), end; at != end; ++at) {
    inCode.insert((*at)[2].matched ? (*at)[2].str() : "put");
  }
  EXPECT_EQ(inManual, inCode);
}

TEST_F(ManualConsoleTest, TheWordsOfTheArgumentsAreNamed) {
  std::set<std::string> words;
  for (const Row& row : manual_.Rows("Command")) {
    for (const std::string& word : CodeSpans(row[1])) words.insert(word);
  }
  EXPECT_EQ(words, (std::set<std::string>{ConsoleTexts_LOKA::kOn, ConsoleTexts_LOKA::kOff,
                                          ConsoleTexts_LOKA::kAll}));
}

TEST_F(ManualConsoleTest, TheRepliesAreThoseOfTheCode) {
  std::set<std::string> inManual;
  for (const Row& row : manual_.Rows("Reply")) inManual.insert(TheSpan(row[0]));
  std::set<std::string> inCode = {Texts_LOKA::kCannotOpenPort, "maxtm = … ms"};
  for (const char* header : {"driver/ConsoleTexts_LOKA.h", "protlib/ConsoleTexts.h"}) {
    for (const auto& [name, text] : ConstantsOf(header)) {
      if (name == "kHelp" || name == "kOn" || name == "kOff" || name == "kAll") continue;
      inCode.insert(WithoutLineEnd(text));
    }
  }
  EXPECT_EQ(inManual, inCode);
}

// What each row of the table of replies says about the result, by making the driver answer so.
TEST_F(ManualConsoleTest, EachReplyHasTheResultSaid) {
  std::set<std::pair<std::string, std::string>> seen;
  const auto note = [&seen](DriverInUse& use, const std::string& line) {
    bool result = false;
    std::string reply = use.Command(line, result);
    if (reply.compare(0, 6, "maxtm ") == 0) reply = "maxtm = … ms";
    seen.emplace(reply, result ? "true" : "false");
  };
  DriverInUse use;
  ASSERT_TRUE(
      use.Start("CfgVer=1 model=1 port=com1 baudrate=9600 parity=even bits=8 stopbits=1 "
                "mode=RS-232"));
  for (const char* line : {"get_stat",
                           "put A",
                           "connect",
                           "connect x",
                           "put",
                           "set_rxGap",
                           "set_rxGap x",
                           "set_hexToken",
                           "set_hexToken x",
                           "set_rxPrefix",
                           "set_rxSuffix",
                           "set_txPrefix",
                           "set_txSuffix",
                           "getmaxtm",
                           "read",
                           "read a b",
                           "write",
                           "write a b c",
                           "write 0?SP_Gap?unsignedInt 00",
                           "write 0?SP_Gap?unsignedInt 0000000x",
                           "write 0?SP_Gap?unsignedInt 00000000",
                           "set_hexToken ON",
                           "put A",
                           "connect OFF",
                           "put 41",
                           "get_stat"}) {
    note(use, line);
  }
  use.Host().Faults().FailAlways("Setup");
  note(use, "connect ON");
  std::set<std::pair<std::string, std::string>> inManual;
  for (const Row& row : manual_.Rows("Reply")) inManual.emplace(TheSpan(row[0]), row[2]);
  EXPECT_EQ(inManual, seen);
}

TEST_F(ManualConsoleTest, TheSessionGoesAsWritten) {
  std::string first;
  for (const MarkdownText::Block& block : manual_.Blocks()) {
    if (first.empty() && block.info == "config") first = block.text;
  }
  DriverInUse use;
  ASSERT_TRUE(use.Start(first));
  use.Receive(
      "\x02"
      "AB\x03\x02"
      "CD\x03",
      "com1");
  for (const Row& row : manual_.Rows("Typed")) {
    bool result = false;
    const std::string reply = use.Command(TheSpan(row[0]), result);
    EXPECT_EQ(reply, row[1].empty() ? "" : TheSpan(row[1])) << row[0];
    EXPECT_EQ(result ? "true" : "false", row[2]) << row[0];
  }
}

TEST_F(ManualConsoleTest, InfoAndXmlReadAsShown) {
  DriverInUse use;
  bool result = false;
  int count = 0;
  for (const MarkdownText::Block& block : manual_.Blocks()) {
    if (block.info == "info") {
      EXPECT_EQ(use.Command("info", result).compare(0, block.text.size(), block.text), 0);
      ++count;
    }
    if (block.info == "xml-reply") {
      EXPECT_EQ(use.Command("xml", result) + "\n", block.text);
      ++count;
    }
  }
  EXPECT_EQ(count, 2);
}

}  // namespace
