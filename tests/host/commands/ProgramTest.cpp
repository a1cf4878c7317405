// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>
#include <sys/stat.h>

#include <algorithm>
#include <regex>

#include "host/port/PseudoTerminal.h"
#include "host/store/SqliteStorage.h"
#include "tests/host/support/PluginConfiguration.h"
#include "tests/host/support/ProgramRun.h"
#include "tests/host/support/TestLimit.h"
#include "tests/host/support/TextParts.h"

namespace {

std::vector<std::string> SubArguments(const std::string& port, const std::string& more) {
  return {"sub",
          "-F",
          "%t  %l  \"%p\"  %x",
          "--port",
          port,
          "--config",
          TestConfiguration("gap=50 " + more)};
}

TEST(Program, HelpFitsOneScreen) {
  for (const std::vector<std::string>& arguments : {std::vector<std::string>{"--help"},
                                                    {"sub", "--help"},
                                                    {"demo", "--help"},
                                                    {"cmd", "--help"},
                                                    {"describe", "--help"}}) {
    ProgramRun run(arguments);
    const std::string help = run.Output();
    EXPECT_EQ(run.Status(), 0);
    EXPECT_EQ(run.Errors(), "");
    // A screen of 24 lines; the options of a command that runs a driver take a larger one.
    EXPECT_LE(std::count(help.begin(), help.end(), '\n'), arguments.size() == 1 ? 24 : 60) << help;
    EXPECT_TRUE(Holds(help, "Exit status: 0 done")) << help;
    EXPECT_FALSE(Holds(help, "demo-device")) << help;
    EXPECT_FALSE(Holds(help, "demo-restarted")) << help;
  }
}

TEST(Program, WrongUsageIsStatus2) {
  const std::vector<std::vector<std::string>> wrong = {
      {},
      {"bogus"},
      {"--bogus"},
      {"sub"},
      {"sub", "--instance", "com1", "--no-attach"},
      {"sub", "-v", "-q", "--port", "/dev/x"},
      {"sub", "--port", "com17=/dev/x", "--config", "CfgVer=1"},
      {"sub", "--port", "/dev/x", "--port", "/dev/y", "--config", "CfgVer=1"},
      {"sub", "--port", "/dev/x", "--config", "CfgVer=1", "--store", "f", "--no-store"}};
  for (const std::vector<std::string>& arguments : wrong) {
    ProgramRun run(arguments);
    EXPECT_EQ(run.Output(), "");
    EXPECT_EQ(run.Status(), 2);
    EXPECT_NE(run.Errors(), "");
  }
}

TEST(Program, WrongUsageSaysWhatIsWrongAndWhereToLook) {
  struct Case {
    std::vector<std::string> words;
    std::string errors;
  };
  const std::vector<Case> cases = {
      {{"bogus"}, "loka: there is no command 'bogus'; loka --help lists them\n"},
      {{"bo\x1b[31mgus"}, "loka: there is no command 'bo\\x1B[31mgus'; loka --help lists them\n"},
      {{"--bogus"},
       "loka: The following argument was not expected: --bogus\nloka: loka --help tells more\n"},
      {{"config", "show"}, "loka: CONFIG is required\nloka: loka config show --help tells more\n"},
      {{"sub", "/dev/x", "-x", "-X"},
       "loka: --hex-output excludes --dump\nloka: loka sub --help tells more\n"}};
  for (const Case& entry : cases) {
    ProgramRun run(entry.words);
    EXPECT_EQ(run.Output(), "");
    EXPECT_EQ(run.Errors(), entry.errors);
    EXPECT_EQ(run.Status(), 2);
  }
}

TEST(Program, DeviceIsNoConfiguration) {
  const PseudoTerminal line;
  ProgramRun run({"config", "check", line.Path()});
  EXPECT_EQ(run.Output(), "");
  EXPECT_EQ(run.Errors(),
            "loka: " + line.Path() +
                ": a device, not a configuration; give the text, a file of it, or -\n");
  EXPECT_NE(run.Status(), 0);
}

TEST(Program, MissingPluginIsStatus3) {
  auto arguments = SubArguments("/dev/x", "");
  arguments.insert(arguments.end(), {"--plugin", "/nowhere/lib.so"});
  ProgramRun run(arguments);
  EXPECT_EQ(run.Status(), 3);
  EXPECT_TRUE(Holds(run.Errors(), "no plug-in found; tried /nowhere/lib.so")) << run.Errors();
  ProgramRun demo({"demo", "--plugin", "/nowhere/lib.so"});
  EXPECT_EQ(demo.Status(), 3);
}

TEST(Program, RejectedConfigurationIsStatus4WithTheDriversWords) {
  ProgramRun run({"sub", "--port", "/dev/x", "--config", "CfgVer=1 model=1 port=com1"});
  EXPECT_EQ(run.Status(), 4);
  EXPECT_TRUE(Holds(run.Errors(), "Parser: parameter 'baudrate' is not found")) << run.Errors();
}

TEST(Program, PortThatCannotBeOpenedIsStatus5WithAdvice) {
  ProgramRun absent(SubArguments("/dev/does-not-exist", ""));
  EXPECT_EQ(absent.Status(), 5);
  EXPECT_TRUE(Holds(absent.Errors(), "Can't open serial port")) << absent.Errors();
  EXPECT_TRUE(Holds(absent.Errors(), "/dev/does-not-exist: no such port")) << absent.Errors();
  ProgramRun unmapped(SubArguments("com2=/dev/x", ""));
  EXPECT_EQ(unmapped.Status(), 5);
  EXPECT_TRUE(Holds(unmapped.Errors(), "--port com1=")) << unmapped.Errors();
}

TEST(Program, SubPrintsEachTokenAndAcknowledgesIt) {
  const PseudoTerminal line;
  ProgramRun sub(SubArguments("com1=" + line.Path(), "rx_prefix=02 rx_suffix=03"));
  ASSERT_TRUE(sub.AwaitErrors("queue 100")) << sub.Errors();
  EXPECT_TRUE(Holds(sub.Errors(), "com1 = " + line.Path() + "  115200 8N1 RS-232"));
  EXPECT_TRUE(Holds(sub.Errors(), "rx 02 ... 03  tx none ... none  gap 50 ms  hex tokens off"));
  const std::string second = std::string("\x02\x1B[31m\xFF\"\x03", 9);
  ASSERT_TRUE(
      line.Send("\x02"
                "ABC\x03" +
                    second,
                Deadline::After(kLimitMs)));
  const std::string time = R"(\d\d:\d\d:\d\d\.\d{3} +)";
  std::string text = sub.Line();
  EXPECT_TRUE(std::regex_match(text, std::regex(time + R"(3  "ABC"  41 42 43)"))) << text;
  text = sub.Line();
  EXPECT_TRUE(
      std::regex_match(text, std::regex(time + R"(7  "\\x1b\[31m\\xff\\""  1B 5B 33 31 6D FF 22)")))
      << text;
  sub.Signal(SIGTERM);
  EXPECT_EQ(sub.Output(), "");
  EXPECT_EQ(sub.Status(), 128 + SIGTERM);
}

TEST(Program, SubHintsAtZeroBytes) {
  const PseudoTerminal line;
  ProgramRun sub(SubArguments(line.Path(), "rx_suffix=03"));
  ASSERT_TRUE(sub.AwaitErrors("queue 100")) << sub.Errors();
  ASSERT_TRUE(line.Send(std::string("ab\0c\x03", 5), Deadline::After(kLimitMs)));
  EXPECT_TRUE(Holds(sub.Line(), R"(  4  "ab"  61 62)"));
  EXPECT_TRUE(sub.AwaitErrors("4 bytes and a zero byte behind the first 2")) << sub.Errors();
  sub.Signal(SIGINT);
  EXPECT_EQ(sub.Status(), 128 + SIGINT);
}

TEST(Program, SubShowsHexTokensAsBytes) {
  const PseudoTerminal line;
  ProgramRun sub(SubArguments(line.Path(), "rx_suffix=03 hex_tokens=true"));
  ASSERT_TRUE(sub.AwaitErrors("hex tokens on")) << sub.Errors();
  ASSERT_TRUE(line.Send(std::string("a\0c\x03", 4), Deadline::After(kLimitMs)));
  EXPECT_TRUE(Holds(sub.Line(), R"(  3  "a\x00c"  61 00 63)"));
}

TEST(Program, SubConnectsWhereTheConfigurationDoesNot) {
  const PseudoTerminal line;
  ProgramRun sub(SubArguments(line.Path(), "rx_suffix=03 autoConnect=false"));
  ASSERT_TRUE(sub.AwaitErrors("queue 100")) << sub.Errors();
  ASSERT_TRUE(line.Send("ab\x03", Deadline::After(kLimitMs)));
  EXPECT_TRUE(Holds(sub.Line(), "\"ab\""));
  ProgramRun absent(SubArguments("/dev/does-not-exist", "autoConnect=false"));
  EXPECT_EQ(absent.Status(), 5);
  EXPECT_TRUE(Holds(absent.Errors(), "no such port")) << absent.Errors();
}

TEST(Program, SecondSubOnAPortSaysWhoHoldsIt) {
  const PseudoTerminal line;
  ProgramRun first(SubArguments(line.Path(), ""));
  ASSERT_TRUE(first.AwaitErrors("queue 100")) << first.Errors();
  ProgramRun second(SubArguments(line.Path(), ""));
  EXPECT_EQ(second.Status(), 5);
  const std::string holder = "held by process " + std::to_string(first.ProcessId()) + " (";
  EXPECT_TRUE(Holds(second.Errors(), holder)) << second.Errors();
  EXPECT_TRUE(Holds(second.Errors(), "loka sub -F")) << second.Errors();
  // The first one is not disturbed.
  ASSERT_TRUE(line.Send("still here", Deadline::After(kLimitMs)));
  EXPECT_TRUE(Holds(first.Line(), "still here"));
}

TEST(Program, SubTellsStoredOverrides) {
  const TemporaryFolder folder;
  const std::string store = folder.File("store.db");
  {
    std::string error;
    const auto storage = SqliteStorage::Open(store, nullptr, &error);
    ASSERT_NE(storage, nullptr) << error;
    storage->SetInteger("com1", "baud", 9600);
    storage->SetString("com1", "rx_suffix", "3B");
    storage->SetInteger("com2", "gap", 7);
  }
  const PseudoTerminal line;
  auto arguments = SubArguments(line.Path(), "rx_suffix=03");
  arguments.insert(arguments.end(), {"--store", store, "-v"});
  ProgramRun sub(arguments);
  ASSERT_TRUE(sub.AwaitErrors("stored override: rx_suffix 3B instead of 03")) << sub.Errors();
  EXPECT_TRUE(Holds(sub.Errors(), "stored override: baud 9600 instead of 115200"));
  EXPECT_FALSE(Holds(sub.Errors(), "stored override: gap"));
  EXPECT_TRUE(Holds(sub.Errors(), "store " + store));
  EXPECT_TRUE(Holds(sub.Errors(), "  9600 8N1 RS-232"));
  ASSERT_TRUE(line.Send("a\x03;", Deadline::After(kLimitMs)));
  EXPECT_TRUE(Holds(sub.Line(), R"("a\x03")"));
}

TEST(Program, StoreStandsInTheStateFolderUnlessSwitchedOff) {
  const PseudoTerminal line;
  struct stat status {};
  {
    ProgramRun sub(SubArguments(line.Path(), ""));
    ASSERT_TRUE(sub.AwaitErrors("queue 100")) << sub.Errors();
    ASSERT_EQ(stat(sub.StoreFile().c_str(), &status), 0);
    EXPECT_EQ(status.st_mode & 0777U, 0600U);
    sub.Signal(SIGINT);
    EXPECT_EQ(sub.Status(), 128 + SIGINT);
  }
  auto arguments = SubArguments(line.Path(), "");
  arguments.emplace_back("--no-store");
  ProgramRun sub(arguments);
  ASSERT_TRUE(sub.AwaitErrors("queue 100")) << sub.Errors();
  EXPECT_NE(stat(sub.StoreFile().c_str(), &status), 0);
}

TEST(Program, StoreThatIsDamagedIsStatus1) {
  const TemporaryFolder folder;
  std::ofstream(folder.File("store.db")) << std::string(5000, 'x');
  auto arguments = SubArguments("/dev/x", "");
  arguments.insert(arguments.end(), {"--store", folder.File("store.db")});
  ProgramRun run(arguments);
  EXPECT_EQ(run.Status(), 1);
  EXPECT_TRUE(Holds(run.Errors(), "is damaged or not a store")) << run.Errors();
  EXPECT_TRUE(Holds(run.Errors(), "--no-store")) << run.Errors();
}

TEST(Program, SignalEndsASubOnABusyLine) {
  const PseudoTerminal line;
  ProgramRun sub(SubArguments(line.Path(), "rx_suffix=03"));
  ASSERT_TRUE(sub.AwaitErrors("queue 100")) << sub.Errors();
  for (int i = 0; i < 50; ++i) {
    ASSERT_TRUE(line.Send("token\x03", Deadline::After(kLimitMs)));
  }
  EXPECT_TRUE(Holds(sub.Line(), "token"));
  sub.Signal(SIGHUP);
  EXPECT_EQ(sub.Status(), 128 + SIGHUP);
}

TEST(Program, DemoGoesThroughAllSteps) {
  ProgramRun demo({"demo"});
  const std::string text = demo.Output();
  EXPECT_EQ(demo.Status(), 0) << text << demo.Errors();
  EXPECT_EQ(demo.Errors(), "");
  EXPECT_TRUE(Holds(text, "\ndemo: 11 of 11 steps as expected\n")) << text;
  EXPECT_TRUE(Holds(text, "02 41 42 03")) << text;
  // Not a terminal: no colours.
  EXPECT_EQ(text.find('\033'), std::string::npos);
}

}  // namespace
