// SPDX-License-Identifier: Apache-2.0
// "explain" and "config" as they are typed.
#include <gtest/gtest.h>

#include <fstream>
#include <nlohmann/json.hpp>
#include <sstream>

#include "tests/host/support/ProgramRun.h"
#include "tests/host/support/TemporaryFolder.h"
#include "tests/host/support/TextParts.h"

namespace {

using Words = std::vector<std::string>;

// Runs the example line at the end of a help text: its commands, joined by a pipe, on this program.
void ExpectExampleRuns(const Words& command) {
  Words help = command;
  help.emplace_back("--help");
  ProgramRun asked(help);
  const std::string text = asked.Output();
  const std::size_t at = text.find("Example: loka ");
  ASSERT_NE(at, std::string::npos) << text;
  std::string line = text.substr(at + 9, text.find('\n', at) - at - 9);
  const std::string program = LOKA_PROGRAM_PATH;
  for (std::size_t word = line.find("loka "); word != std::string::npos;
       word = line.find("loka ", word + program.size())) {
    line.replace(word, 4, "\"$0\"");
  }
  ChildProcess shell("/bin/sh", {"sh", "-c",
                                 "export LOKA_PLUGIN='" + PluginLibrary::DefaultPath() + "'; " +
                                     "{ " + line + "; } 2>/dev/null",
                                 program});
  std::string first;
  EXPECT_TRUE(shell.ReadLine(Deadline::After(ProgramRun::kLimitMs), &first)) << line;
  for (std::string more; shell.ReadLine(Deadline::After(ProgramRun::kLimitMs), &more);) {
  }
  EXPECT_EQ(shell.Wait(Deadline::After(ProgramRun::kLimitMs)), 0) << line;
}

TEST(ExplainProgram, SaysWhatEachByteIs) {
  ProgramRun run(
      {"explain", "--rx-prefix", "0202", "--rx-suffix", "03", "02", "05", "02", "02", "41", "03"});
  EXPECT_EQ(run.Output(),
            "02 05 dropped (prefix restart)  02 02 prefix  41 body  03 suffix   token \"A\"\n");
  EXPECT_EQ(run.Status(), 0);
  EXPECT_TRUE(Holds(run.Errors(), "loka: rx 0202…03  gap 0 (500 ms)\n")) << run.Errors();
  EXPECT_TRUE(Holds(run.Errors(), "loka: tokens 1  dropped 2 bytes\n")) << run.Errors();
}

TEST(ExplainProgram, SaysThatTheGapEndsSuffixFramingToo) {
  ProgramRun run({"explain", "--rx-suffix", "CR", "41", "~499", "42", "~", "43", "0D"});
  EXPECT_EQ(run.Output(),
            "41 42 dropped (no suffix after 500 ms)\n43 body  0D suffix   token \"C\"\n");
  EXPECT_TRUE(Holds(run.Errors(), "no-suffix: a silence as long as the gap ends suffix framing"))
      << run.Errors();
  EXPECT_TRUE(Holds(run.Errors(), "--gap")) << run.Errors();
}

TEST(ExplainProgram, SaysThatTagsEndAtAZeroByte) {
  ProgramRun plain({"explain", "--rx-suffix", "CR", "41", "00", "42", "0D"});
  EXPECT_EQ(plain.Output(), "41 00 42 body  0D suffix   token \"A\\x00B\"\n");
  EXPECT_TRUE(Holds(plain.Errors(), "zero byte: tags show it up to there; --hex shows all"));
  ProgramRun hex({"explain", "--hex", "--rx-suffix", "CR", "41", "00", "42", "0D"});
  EXPECT_EQ(hex.Status(), 0);
  EXPECT_FALSE(Holds(hex.Errors(), "zero byte"));
}

TEST(ExplainProgram, SilencesThatFollowEachOtherAddUp) {
  ProgramRun run({"explain", "--check", "41", "~300", "42", "~300", "~300", "43"});
  EXPECT_EQ(run.Output(),
            "41 42 body   token \"AB\" (ended by 500 ms of silence)\n"
            "43 body   token \"C\" (ended by 500 ms of silence)\n");
  EXPECT_EQ(run.Status(), 0);
  EXPECT_TRUE(Holds(run.Errors(), "cuts the same 2 tokens")) << run.Errors();
}

TEST(ExplainProgram, JsonSurvivesEveryByte) {
  const TemporaryFolder folder;
  std::string bytes;
  for (int code = 0; code < 256; ++code) {
    bytes += static_cast<char>(code);
  }
  std::ofstream(folder.File("bytes"), std::ios::binary) << bytes;
  ProgramRun run({"explain", "-j", folder.File("bytes")});
  std::istringstream lines(run.Output());
  std::vector<nlohmann::json> objects;
  for (std::string line; std::getline(lines, line);) {
    objects.push_back(nlohmann::json::parse(line));
  }
  ASSERT_EQ(objects.size(), 2U);
  EXPECT_EQ(objects[0]["ev"], "label");
  EXPECT_EQ(objects[0]["role"], "body");
  EXPECT_EQ(objects[1]["ev"], "token");
  EXPECT_EQ(objects[1]["len"], 256);
  std::string hex = objects[1]["hex"];
  EXPECT_EQ(hex.substr(0, 8), "00010203");
  EXPECT_EQ(hex.size(), 512U);
}

TEST(ExplainProgram, JsonOfADrop) {
  ProgramRun run({"explain", "-j", "--rx-suffix", "CR", "53", "54"});
  EXPECT_EQ(run.Output(),
            "{\"ev\":\"drop\",\"at\":0,\"why\":\"no-suffix\",\"after_ms\":500,\"hex\":\"5354\"}\n");
}

TEST(ExplainProgram, ColoursOnlyWhereAskedFor) {
  const Words words = {"explain", "--rx-prefix", "02", "02", "41"};
  EXPECT_FALSE(Holds(ProgramRun(words).Output(), "\x1B"));
  Words always = words;
  always.insert(always.end(), {"--color", "always"});
  EXPECT_TRUE(Holds(ProgramRun(always).Output(), "\x1B[2m02 prefix\x1B[0m"));
}

TEST(ExplainProgram, TakesTheFramingOfAConfiguration) {
  ProgramRun run({"explain", "--config",
                  "CfgVer=1 model=1 port=com1 baudrate=9600 parity=even bits=8 stopbits=1 "
                  "mode=RS-232 rx_prefix=02 rx_suffix=03",
                  "--rx-suffix", "04", "--check", "02", "41", "04"});
  EXPECT_EQ(run.Output(), "02 prefix  41 body  04 suffix   token \"A\"\n");
  EXPECT_EQ(run.Status(), 0) << run.Errors();
}

TEST(ExplainProgram, WrongUseIsStatus2) {
  for (const Words& words :
       {Words{"explain"}, Words{"explain", "xyz"}, Words{"explain", "02", "xyz"},
        Words{"explain", "--rx-prefix", "2", "02"}, Words{"explain", "--color", "red", "02"},
        Words{"explain", "--config", "/nowhere", "02"}, Words{"explain", "--config", "-", "-"}}) {
    ProgramRun run(words);
    EXPECT_EQ(run.Output(), "");
    EXPECT_EQ(run.Status(), 2);
    EXPECT_NE(run.Errors(), "");
  }
}

TEST(ExplainProgram, CheckTellsWhatTheDriverSays) {
  ProgramRun refused({"explain", "--check", "--config", "CfgVer=1 model=1", "02"});
  EXPECT_EQ(refused.Status(), 4);
  EXPECT_TRUE(Holds(refused.Errors(), "loka: Parser: parameter 'port' is not found"));
  ProgramRun absent({"explain", "--check", "--plugin", "/nowhere/lib.so", "02"});
  EXPECT_EQ(absent.Status(), 3);
}

TEST(ConfigProgram, NewCheckAndShow) {
  const TemporaryFolder folder;
  ProgramRun made({"config", "new", "-b", "9600", "-d", "7", "-p", "even", "--rx-prefix", "STX",
                   "--rx-suffix", "ETX", "--tx-suffix", "CRLF"});
  const std::string configuration = made.Output();
  EXPECT_EQ(configuration,
            "CfgVer=1 model=1 port=com1 baudrate=9600 parity=even bits=7 stopbits=1 mode=RS-232 "
            "rx_prefix=02 rx_suffix=03 tx_suffix=0D0A\n");
  std::ofstream(folder.File("scale.cfg")) << configuration;
  ProgramRun check({"config", "check", folder.File("scale.cfg")});
  EXPECT_EQ(check.Output(),
            "ok  com1 9600 7E1 RS-232  rx 02…03  tx …0D0A  gap 0 (500 ms)  queue 100\n");
  EXPECT_EQ(check.Status(), 0);
  ProgramRun show({"config", "show", folder.File("scale.cfg")});
  EXPECT_TRUE(Holds(show.Output(), "bits=7                  given (default 8); 7, 8"));
  EXPECT_EQ(show.Status(), 0);
}

TEST(ConfigProgram, CheckTellsTheDriversExactWords) {
  ProgramRun run({"config", "check",
                  "CfgVer=1 model=1 port=com1 baudrate=9600 parity=space bits=8 stopbits=1 "
                  "mode=RS-232"});
  EXPECT_EQ(run.Output(), "");
  EXPECT_EQ(run.Status(), 4);
  EXPECT_TRUE(Holds(run.Errors(), "loka: Parser: parameter 'parity' has invalid value\n"));
}

TEST(ConfigProgram, CheckWarnsOfWhatTheDescriptionDoesNotOffer) {
  ProgramRun run({"config", "check",
                  "CfgVer=1 model=1 port=com1 baudrate=9600 parity=mark bits=8 stopbits=1 "
                  "mode=RS-232"});
  EXPECT_EQ(run.Output(),
            "ok  com1 9600 8M1 RS-232  rx by silence  tx bare  gap 0 (500 ms)  "
            "queue 100\n");
  EXPECT_EQ(run.Status(), 0);
  EXPECT_TRUE(Holds(run.Errors(), "parity=mark: not among what the driver's description offers"));
}

TEST(ConfigProgram, WrongUseIsStatus2) {
  for (const Words& words :
       {Words{"config"}, Words{"config", "check"}, Words{"config", "show", "/nowhere"},
        Words{"config", "new", "-b", "9601"}, Words{"config", "new", "word"}}) {
    ProgramRun run(words);
    EXPECT_EQ(run.Output(), "");
    EXPECT_EQ(run.Status(), 2);
  }
}

TEST(FramingProgram, ExamplesOfTheHelpRun) {
  ExpectExampleRuns({"explain"});
  ExpectExampleRuns({"config"});
  ExpectExampleRuns({"config", "new"});
  ExpectExampleRuns({"config", "check"});
  ExpectExampleRuns({"config", "show"});
}

}  // namespace
