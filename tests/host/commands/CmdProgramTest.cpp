// SPDX-License-Identifier: Apache-2.0
// loka cmd, run as a program.
#include <gtest/gtest.h>

#include "host/port/PseudoTerminal.h"
#include "host/store/SqliteStorage.h"
#include "tests/host/support/PluginConfiguration.h"
#include "tests/host/support/ProgramRun.h"
#include "tests/host/support/TestLimit.h"
#include "tests/host/support/TextParts.h"

namespace {

using Words = std::vector<std::string>;

// A command on a port that is given in front of the options.
Words OnPort(const std::string& port, const Words& words, const std::string& more = "") {
  Words all = {"cmd", port, "--config", TestConfiguration("gap=20 " + more)};
  all.insert(all.end(), words.begin(), words.end());
  return all;
}

TEST(CmdProgram, HelpNeedsNoPort) {
  ProgramRun run({"cmd", "help"});
  const std::string help = run.Output();
  EXPECT_EQ(run.Status(), 0);
  EXPECT_EQ(run.Errors(), "");
  EXPECT_EQ(help.rfind("help - displays this message\n", 0), 0U) << help;
  EXPECT_TRUE(Holds(help, "\nset_txSuffix string - set the tx suffix\n")) << help;
}

TEST(CmdProgram, WhatNeedsNoPortOpensNone) {
  struct Case {
    const char* command;
    const char* output;
  };
  const Case cases[] = {{"xml", "compressedXML="},
                        {"getmaxtm", "maxtm = 0 ms\n"},
                        {"lasterror", ""},
                        {"deletetags", ""},
                        {"info", "Protocol: LOKA (471) v.111\n"}};
  for (const Case& entry : cases) {
    ProgramRun run({"cmd", "/dev/does-not-exist", entry.command});
    EXPECT_EQ(run.Output().rfind(entry.output, 0), 0U) << entry.command;
    EXPECT_EQ(run.Status(), 0) << entry.command;
    EXPECT_TRUE(Holds(run.Errors(), "needs no port: none is opened")) << run.Errors();
  }
}

TEST(CmdProgram, SaysWhatACommandNeeds) {
  for (const Words& words :
       {Words{"cmd", "get_stat"}, {"cmd", "--config", TestConfiguration(""), "get_stat"}}) {
    ProgramRun run(words);
    EXPECT_EQ(run.Output(), "");
    EXPECT_EQ(run.Status(), 2);
    EXPECT_TRUE(Holds(run.Errors(), "'get_stat' needs a running instance, or a port"))
        << run.Errors();
  }
}

TEST(CmdProgram, WrongUsageIsStatus2) {
  const PseudoTerminal line;
  const std::vector<Words> wrong = {
      {"cmd"},
      {"cmd", "--"},
      {"cmd", ""},
      {"cmd", "/dev/x"},
      {"cmd", "--bogus", "help"},
      {"cmd", "--port"},
      OnPort("com17=/dev/x", {"get_stat"}),
      {"cmd", "/dev/x", "--port", "/dev/y", "--config", "CfgVer=1", "get_stat"},
      {"cmd", "--store", "f", "--no-store", "help"}};
  for (const Words& words : wrong) {
    ProgramRun run(words);
    EXPECT_EQ(run.Output(), "");
    EXPECT_EQ(run.Status(), 2) << testing::PrintToString(words);
    EXPECT_NE(run.Errors(), "");
  }
}

TEST(CmdProgram, ReplyGoesToStdoutAndSettingsToStderr) {
  const PseudoTerminal line;
  ProgramRun run(OnPort(line.Path(), {"get_stat"}));
  EXPECT_EQ(run.Output(), "Connected\n");
  EXPECT_EQ(run.Status(), 0);
  EXPECT_TRUE(Holds(run.Errors(), "started for this command only")) << run.Errors();
  EXPECT_TRUE(Holds(run.Errors(), "com1 = " + line.Path() + "  115200 8N1 RS-232"));
}

TEST(CmdProgram, PortStandsInFrontOrBehindPortOption) {
  const PseudoTerminal line;
  const std::string configuration = TestConfiguration("gap=20");
  for (const Words& words :
       {Words{"cmd", "--config", configuration, "com1=" + line.Path(), "get_stat"},
        Words{"cmd", "--config=" + configuration, "--port=" + line.Path(), "get_stat"},
        Words{"cmd", "--port", "com1=" + line.Path(), "--config", configuration, "get_stat"},
        Words{"cmd", "-v", "com2=/dev/x", "--port", "com1=" + line.Path(), "--config",
              configuration, "--", "get_stat"}}) {
    ProgramRun run(words);
    EXPECT_EQ(run.Output(), "Connected\n") << run.Errors();
    EXPECT_EQ(run.Status(), 0);
  }
}

TEST(CmdProgram, FalseIsStatus1WithTheDriversTextOnStderr) {
  const PseudoTerminal line;
  ProgramRun run(OnPort(line.Path(), {"put"}));
  EXPECT_EQ(run.Output(), "");
  EXPECT_EQ(run.Status(), 1);
  EXPECT_TRUE(Holds(run.Errors(), "\nERROR: string to send is missing\n")) << run.Errors();
  ProgramRun closed(OnPort(line.Path(), {"put", "a"}, "autoConnect=false"));
  EXPECT_EQ(closed.Status(), 1);
  EXPECT_TRUE(Holds(closed.Errors(), "\nERROR: serial port is not active for sending\n"));
  ProgramRun unknown(OnPort(line.Path(), {"bogus", "word"}));
  EXPECT_EQ(unknown.Status(), 1);
  EXPECT_TRUE(Holds(unknown.Errors(), "the driver does not know the command 'bogus'"));
}

// The driver's results, also where they surprise.
TEST(CmdProgram, TrueIsStatus0WhateverTheTextSays) {
  const PseudoTerminal line;
  ProgramRun run(OnPort(line.Path(), {"set_rxGap", "soon"}));
  EXPECT_EQ(run.Output(), "ERROR: wrong value\n");
  EXPECT_EQ(run.Status(), 0) << run.Errors();
}

TEST(CmdProgram, WordsAreJoinedWithOneBlankAndEndTheOptions) {
  struct Case {
    Words words;
    std::string sent;
  };
  const std::vector<Case> cases = {
      {{"put", "hello", "world"}, "hello world"},
      {{"put", "two  blanks "}, "two  blanks "},
      {{"put hello", "world"}, "hello world"},
      {{"put", "--config", "-v", "--", "/dev/x", "watch"}, "--config -v -- /dev/x watch"},
  };
  for (const Case& entry : cases) {
    const PseudoTerminal line;
    ProgramRun run(OnPort(line.Path(), entry.words, "tx_prefix=02 tx_suffix=03"));
    std::string seen;
    const std::string expected = "\x02" + entry.sent + "\x03";
    EXPECT_TRUE(line.Receive(expected.size(), Deadline::After(kLimitMs), &seen));
    EXPECT_EQ(seen, expected);
    EXPECT_EQ(run.Output(), "OK\n");
    EXPECT_EQ(run.Status(), 0) << run.Errors();
  }
}

TEST(CmdProgram, ReadAndWriteTags) {
  const PseudoTerminal line;
  ProgramRun read(OnPort(line.Path(), {"read", "0?SP_Baud?unsignedInt"}));
  EXPECT_EQ(read.Output(), "00c20100\n");
  EXPECT_EQ(read.Status(), 0);
  ProgramRun longest(OnPort(line.Path(), {"read", "0?SP_RxPrefix?string-9999"}));
  EXPECT_EQ(longest.Output(), std::string(19998, '0') + "\n");
}

TEST(CmdProgram, WhatIsStoredIsThereNextTime) {
  const PseudoTerminal line;
  const TemporaryFolder folder;
  const std::string store = folder.File("store.db");
  {
    std::string error;
    const auto storage = SqliteStorage::Open(store, nullptr, &error);
    ASSERT_NE(storage, nullptr) << error;
    storage->SetInteger("com1", "gap", 7);
  }
  const Words read = {"read", "0?SP_Gap?unsignedInt"};
  Words words = {"--store", store};
  words.insert(words.end(), read.begin(), read.end());
  ProgramRun stored(OnPort(line.Path(), words));
  EXPECT_EQ(stored.Output(), "07000000\n");
  EXPECT_TRUE(Holds(stored.Errors(), "stored override: gap 7 instead of 20")) << stored.Errors();
  words = {"--no-store"};
  words.insert(words.end(), read.begin(), read.end());
  ProgramRun fresh(OnPort(line.Path(), words));
  EXPECT_EQ(fresh.Output(), "14000000\n");
}

TEST(CmdProgram, FailuresHaveTheStatusesOfWatch) {
  ProgramRun plugin({"cmd", "--plugin", "/nowhere/lib.so", "help"});
  EXPECT_EQ(plugin.Status(), 3);
  ProgramRun configuration({"cmd", "/dev/x", "--config", "CfgVer=2", "get_stat"});
  EXPECT_EQ(configuration.Status(), 4);
  EXPECT_TRUE(Holds(configuration.Errors(), "Parser: unknown format"));
  ProgramRun port(OnPort("/dev/does-not-exist", {"get_stat"}));
  EXPECT_EQ(port.Status(), 5);
  EXPECT_TRUE(Holds(port.Errors(), "/dev/does-not-exist: no such port")) << port.Errors();
}

TEST(CmdProgram, ReplyThatCannotBeWrittenIsStatus1) {
  ProgramRun run({"cmd", "help"}, R"(sh -c 'exec "$0" "$@" >/dev/full')");
  EXPECT_EQ(run.Status(), 1);
  EXPECT_TRUE(Holds(run.Errors(), "cannot write the result: No space left")) << run.Errors();
}

}  // namespace
