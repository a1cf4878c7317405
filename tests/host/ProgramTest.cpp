// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>
#include <sys/stat.h>

#include <algorithm>
#include <regex>

#include "host/PseudoTerminal.h"
#include "host/SqliteStorage.h"
#include "tests/host/PluginConfiguration.h"
#include "tests/host/ProgramRun.h"

namespace {

constexpr int kLimitMs = 20000;

std::vector<std::string> WatchArguments(const std::string& port, const std::string& more) {
  return {"watch", "--port", port, "--config", TestConfiguration("gap=50 " + more)};
}

bool Holds(const std::string& text, const std::string& part) {
  return text.find(part) != std::string::npos;
}

TEST(Program, HelpFitsOneScreen) {
  for (const std::vector<std::string>& arguments : {std::vector<std::string>{"--help"},
                                                    {"watch", "--help"},
                                                    {"demo", "--help"},
                                                    {"cmd", "--help"},
                                                    {"describe", "--help"}}) {
    ProgramRun run(arguments);
    const std::string help = run.Output();
    EXPECT_EQ(run.Status(), 0);
    EXPECT_EQ(run.Errors(), "");
    // A screen of 24 lines; the list of all commands takes a larger one.
    EXPECT_LE(std::count(help.begin(), help.end(), '\n'), arguments.size() == 1 ? 40 : 24) << help;
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
      {"watch"},
      {"watch", "--port", "/dev/x"},
      {"watch", "--config", "CfgVer=1"},
      {"watch", "--port", "com17=/dev/x", "--config", "CfgVer=1"},
      {"watch", "--port", "/dev/x", "--port", "/dev/y", "--config", "CfgVer=1"},
      {"watch", "--port", "/dev/x", "--config", "CfgVer=1", "--store", "f", "--no-store"}};
  for (const std::vector<std::string>& arguments : wrong) {
    ProgramRun run(arguments);
    EXPECT_EQ(run.Output(), "");
    EXPECT_EQ(run.Status(), 2);
    EXPECT_NE(run.Errors(), "");
  }
}

TEST(Program, MissingPluginIsStatus3) {
  auto arguments = WatchArguments("/dev/x", "");
  arguments.insert(arguments.end(), {"--plugin", "/nowhere/lib.so"});
  ProgramRun run(arguments);
  EXPECT_EQ(run.Status(), 3);
  EXPECT_TRUE(Holds(run.Errors(), "no plug-in found; tried /nowhere/lib.so")) << run.Errors();
  ProgramRun demo({"demo", "--plugin", "/nowhere/lib.so"});
  EXPECT_EQ(demo.Status(), 3);
}

TEST(Program, RejectedConfigurationIsStatus4WithTheDriversWords) {
  ProgramRun run({"watch", "--port", "/dev/x", "--config", "CfgVer=1 model=1 port=com1"});
  EXPECT_EQ(run.Status(), 4);
  EXPECT_TRUE(Holds(run.Errors(), "Parser: parameter 'baudrate' is not found")) << run.Errors();
}

TEST(Program, PortThatCannotBeOpenedIsStatus5WithAdvice) {
  ProgramRun absent(WatchArguments("/dev/does-not-exist", ""));
  EXPECT_EQ(absent.Status(), 5);
  EXPECT_TRUE(Holds(absent.Errors(), "Can't open serial port")) << absent.Errors();
  EXPECT_TRUE(Holds(absent.Errors(), "/dev/does-not-exist: no such port")) << absent.Errors();
  ProgramRun unmapped(WatchArguments("com2=/dev/x", ""));
  EXPECT_EQ(unmapped.Status(), 5);
  EXPECT_TRUE(Holds(unmapped.Errors(), "--port com1=")) << unmapped.Errors();
}

TEST(Program, WatchPrintsEachTokenAndAcknowledgesIt) {
  const PseudoTerminal line;
  ProgramRun watch(WatchArguments("com1=" + line.Path(), "rx_prefix=02 rx_suffix=03"));
  ASSERT_TRUE(watch.AwaitErrors("queue 100")) << watch.Errors();
  EXPECT_TRUE(Holds(watch.Errors(), "com1 = " + line.Path() + "  115200 8N1 RS-232"));
  EXPECT_TRUE(Holds(watch.Errors(), "rx 02 ... 03  tx none ... none  gap 50 ms  hex tokens off"));
  const std::string second = std::string("\x02\x1B[31m\xFF\"\x03", 9);
  ASSERT_TRUE(
      line.Send("\x02"
                "ABC\x03" +
                    second,
                Deadline::After(kLimitMs)));
  const std::string time = R"(\d\d:\d\d:\d\d\.\d{6} +)";
  std::string text = watch.Line();
  EXPECT_TRUE(std::regex_match(text, std::regex(time + R"(3  "ABC"  41 42 43)"))) << text;
  text = watch.Line();
  EXPECT_TRUE(
      std::regex_match(text, std::regex(time + R"(7  "\\x1b\[31m\\xff\\""  1B 5B 33 31 6D FF 22)")))
      << text;
  watch.Signal(SIGTERM);
  EXPECT_EQ(watch.Output(), "");
  EXPECT_EQ(watch.Status(), 128 + SIGTERM);
}

TEST(Program, WatchHintsAtZeroBytes) {
  const PseudoTerminal line;
  ProgramRun watch(WatchArguments(line.Path(), "rx_suffix=03"));
  ASSERT_TRUE(watch.AwaitErrors("queue 100")) << watch.Errors();
  ASSERT_TRUE(line.Send(std::string("ab\0c\x03", 5), Deadline::After(kLimitMs)));
  EXPECT_TRUE(Holds(watch.Line(), R"(   4  "ab"...  61 62 00 ...)"));
  EXPECT_TRUE(watch.AwaitErrors("4 bytes and a zero byte behind the first 2")) << watch.Errors();
  watch.Signal(SIGINT);
  EXPECT_EQ(watch.Status(), 128 + SIGINT);
}

TEST(Program, WatchShowsHexTokensAsBytes) {
  const PseudoTerminal line;
  ProgramRun watch(WatchArguments(line.Path(), "rx_suffix=03 hex_tokens=true"));
  ASSERT_TRUE(watch.AwaitErrors("hex tokens on")) << watch.Errors();
  ASSERT_TRUE(line.Send(std::string("a\0c\x03", 4), Deadline::After(kLimitMs)));
  EXPECT_TRUE(Holds(watch.Line(), R"(   3  "a\x00c"  61 00 63)"));
}

TEST(Program, WatchConnectsWhereTheConfigurationDoesNot) {
  const PseudoTerminal line;
  ProgramRun watch(WatchArguments(line.Path(), "rx_suffix=03 autoConnect=false"));
  ASSERT_TRUE(watch.AwaitErrors("queue 100")) << watch.Errors();
  ASSERT_TRUE(line.Send("ab\x03", Deadline::After(kLimitMs)));
  EXPECT_TRUE(Holds(watch.Line(), "\"ab\""));
  ProgramRun absent(WatchArguments("/dev/does-not-exist", "autoConnect=false"));
  EXPECT_EQ(absent.Status(), 5);
  EXPECT_TRUE(Holds(absent.Errors(), "no such port")) << absent.Errors();
}

TEST(Program, SecondWatchOnAPortSaysWhoHoldsIt) {
  const PseudoTerminal line;
  ProgramRun first(WatchArguments(line.Path(), ""));
  ASSERT_TRUE(first.AwaitErrors("queue 100")) << first.Errors();
  ProgramRun second(WatchArguments(line.Path(), ""));
  EXPECT_EQ(second.Status(), 5);
  const std::string holder = "held by process " + std::to_string(first.ProcessId()) + " (";
  EXPECT_TRUE(Holds(second.Errors(), holder)) << second.Errors();
  EXPECT_TRUE(Holds(second.Errors(), "loka watch --port")) << second.Errors();
  // The first one is not disturbed.
  ASSERT_TRUE(line.Send("still here", Deadline::After(kLimitMs)));
  EXPECT_TRUE(Holds(first.Line(), "still here"));
}

TEST(Program, WatchTellsStoredOverrides) {
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
  auto arguments = WatchArguments(line.Path(), "rx_suffix=03");
  arguments.insert(arguments.end(), {"--store", store, "-v"});
  ProgramRun watch(arguments);
  ASSERT_TRUE(watch.AwaitErrors("stored override: rx_suffix 3B instead of 03")) << watch.Errors();
  EXPECT_TRUE(Holds(watch.Errors(), "stored override: baud 9600 instead of 115200"));
  EXPECT_FALSE(Holds(watch.Errors(), "stored override: gap"));
  EXPECT_TRUE(Holds(watch.Errors(), "store " + store));
  EXPECT_TRUE(Holds(watch.Errors(), "  9600 8N1 RS-232"));
  ASSERT_TRUE(line.Send("a\x03;", Deadline::After(kLimitMs)));
  EXPECT_TRUE(Holds(watch.Line(), R"("a\x03")"));
}

TEST(Program, StoreStandsInTheStateFolderUnlessSwitchedOff) {
  const PseudoTerminal line;
  struct stat status {};
  {
    ProgramRun watch(WatchArguments(line.Path(), ""));
    ASSERT_TRUE(watch.AwaitErrors("queue 100")) << watch.Errors();
    ASSERT_EQ(stat(watch.StoreFile().c_str(), &status), 0);
    EXPECT_EQ(status.st_mode & 0777U, 0600U);
    watch.Signal(SIGINT);
    EXPECT_EQ(watch.Status(), 128 + SIGINT);
  }
  auto arguments = WatchArguments(line.Path(), "");
  arguments.emplace_back("--no-store");
  ProgramRun watch(arguments);
  ASSERT_TRUE(watch.AwaitErrors("queue 100")) << watch.Errors();
  EXPECT_NE(stat(watch.StoreFile().c_str(), &status), 0);
}

TEST(Program, StoreThatIsDamagedIsStatus1) {
  const TemporaryFolder folder;
  std::ofstream(folder.File("store.db")) << std::string(5000, 'x');
  auto arguments = WatchArguments("/dev/x", "");
  arguments.insert(arguments.end(), {"--store", folder.File("store.db")});
  ProgramRun run(arguments);
  EXPECT_EQ(run.Status(), 1);
  EXPECT_TRUE(Holds(run.Errors(), "is damaged or not a store")) << run.Errors();
  EXPECT_TRUE(Holds(run.Errors(), "--no-store")) << run.Errors();
}

TEST(Program, SignalEndsAWatchOnABusyLine) {
  const PseudoTerminal line;
  ProgramRun watch(WatchArguments(line.Path(), "rx_suffix=03"));
  ASSERT_TRUE(watch.AwaitErrors("queue 100")) << watch.Errors();
  for (int i = 0; i < 50; ++i) {
    ASSERT_TRUE(line.Send("token\x03", Deadline::After(kLimitMs)));
  }
  EXPECT_TRUE(Holds(watch.Line(), "token"));
  watch.Signal(SIGHUP);
  EXPECT_EQ(watch.Status(), 128 + SIGHUP);
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
