// SPDX-License-Identifier: Apache-2.0
// loka term with lines from a pipe; TermTmuxTest has the keys.
#include <gtest/gtest.h>

#include "tests/host/commands/InstanceRun.h"
#include "tests/host/support/TextParts.h"

namespace {

class TermProgram : public testing::Test {
 protected:
  std::unique_ptr<ProgramRun> Start(const std::string& more,
                                    const std::vector<std::string>& options = {}) {
    std::vector<std::string> arguments = {"term", line_.Path(), "--config", TestConfiguration(more),
                                          "--no-store"};
    arguments.insert(arguments.end(), options.begin(), options.end());
    return std::make_unique<ProgramRun>(arguments);
  }
  bool DeviceSends(const std::string& bytes) { return line_.Send(bytes, ProgramRun::Limit()); }
  std::string DeviceGets(std::size_t count) {
    std::string bytes;
    EXPECT_TRUE(line_.Receive(count, ProgramRun::Limit(), &bytes));
    return bytes;
  }

  PseudoTerminal line_;
};

TEST_F(TermProgram, SendsEachLineAndPrintsTokens) {
  const auto run = Start("tx_suffix=0D rx_suffix=03");
  ASSERT_TRUE(run->Type("R"));
  ASSERT_TRUE(run->Type("\\x02\\t\\\\"));
  ASSERT_TRUE(run->Type(""));
  EXPECT_EQ(DeviceGets(7), "R\r\x02\t\\\r\r");
  ASSERT_TRUE(DeviceSends("A\x1B[31m\x03"));
  EXPECT_EQ(run->Line(), "A\\x1b[31m");
  EXPECT_EQ(run->Status(), 0);
  EXPECT_FALSE(Holds(run->Errors(), "ctrl-t")) << run->Errors();
}

TEST_F(TermProgram, StaysForAnAnswerBehindTheEndOfTheInput) {
  // Long enough for the answer below on a busy machine; the end does not wait for all of it.
  const auto run = Start("rx_suffix=03", {"-W", "20"});
  ASSERT_TRUE(run->Type("R"));
  EXPECT_EQ(DeviceGets(1), "R");
  ASSERT_TRUE(DeviceSends("late\x03"));
  EXPECT_EQ(run->Line(), "late");
  run->Signal(SIGTERM);
  EXPECT_EQ(run->Status(), 128 + SIGTERM);
}

TEST_F(TermProgram, HexLinesAreBytes) {
  const auto run = Start("tx_suffix=0D", {"--input", "hex"});
  for (const char* const typed : {"02 41", "STX 42 CR LF", ""}) {
    ASSERT_TRUE(run->Type(typed));
  }
  EXPECT_EQ(DeviceGets(8),
            "\x02"
            "A\r\x02"
            "B\r\n\r");
  EXPECT_EQ(run->Status(), 0);
}

TEST_F(TermProgram, ConsoleLinesAreCommandsOfTheDriver) {
  const auto run = Start("rx_suffix=03", {"--input", "console"});
  ASSERT_TRUE(run->Type("get_stat"));
  EXPECT_EQ(run->Line(), "Connected");
  ASSERT_TRUE(run->Type("set_rxSuffix 0D"));
  EXPECT_EQ(run->Line(), "OK");
  EXPECT_TRUE(run->AwaitErrors("in effect until the driver is restarted and never stored"))
      << run->Errors();
  ASSERT_TRUE(run->Type("no_such_command"));
  EXPECT_TRUE(run->AwaitErrors("the driver does not know this command")) << run->Errors();
  EXPECT_EQ(run->Status(), 1);
}

TEST_F(TermProgram, ALineThatIsNoneIsToldAndTheNextOnesAreSent) {
  const auto run = Start("");
  ASSERT_TRUE(run->Type("\\q"));
  ASSERT_TRUE(run->Type("B"));
  EXPECT_EQ(DeviceGets(1), "B");
  EXPECT_EQ(run->Status(), 2);
  EXPECT_TRUE(Holds(run->Errors(), "behind a backslash: ")) << run->Errors();
}

TEST_F(TermProgram, ShowsTokensInTheOutputModes) {
  const std::vector<std::pair<std::string, std::string>> modes = {
      {"text", "A\\x1b[1m"},
      {"hex", "41 1B 5B 31 6D"},
      {"dump", "rx 41 1B 5B 31 6D 03   A.[1m."},
      {"raw", "A\x1B[1m"}};
  for (const auto& [mode, shown] : modes) {
    const auto run = Start("rx_suffix=03", {"--output", mode, "--color", "never"});
    ASSERT_TRUE(run->AwaitErrors("commands attach at")) << run->Errors();
    ASSERT_TRUE(DeviceSends("A\x1B[1m\x03"));
    EXPECT_EQ(run->Line(), shown) << mode;
    EXPECT_EQ(run->Status(), 0) << mode;
  }
}

TEST_F(TermProgram, AttachesToARunningInstanceAndEndsWithIt) {
  InstanceRun instance("rx_suffix=03 tx_suffix=0D", "auto");
  ASSERT_TRUE(instance.IsReady()) << instance.Errors();
  const auto run = instance.Begin({"term"});
  ASSERT_TRUE(run->AwaitErrors("attached to the running instance com1")) << run->Errors();
  ASSERT_TRUE(run->Type("R"));
  std::string bytes;
  EXPECT_TRUE(instance.Line().Receive(2, ProgramRun::Limit(), &bytes));
  EXPECT_EQ(bytes, "R\r");
  ASSERT_TRUE(instance.Line().Send("A\x03", ProgramRun::Limit()));
  EXPECT_EQ(run->Line(), "A");
  instance.Stop();
  EXPECT_EQ(run->Output(), "");
  EXPECT_EQ(run->Status(), 6);
  EXPECT_TRUE(Holds(run->Errors(), "the running instance has ended")) << run->Errors();
}

TEST_F(TermProgram, OthersAttachToIt) {
  const TemporaryFolder folder;
  const std::string environment = "LOKA_RUNTIME_DIR='" + folder.File("control") + "'";
  const ProgramRun term(
      {"term", line_.Path(), "--config", TestConfiguration("tx_suffix=0D"), "--no-store"},
      environment);
  ASSERT_TRUE(term.AwaitErrors("commands attach at")) << term.Errors();
  ProgramRun send({"send", "--attach", "-m", "S"}, environment);
  EXPECT_EQ(send.Status(), 0) << send.Errors();
  EXPECT_EQ(DeviceGets(2), "S\r");
}

TEST_F(TermProgram, EndsWhenTheLineIsGoneForGood) {
  auto device = std::make_unique<PseudoTerminal>();
  ProgramRun run({"term", "com1=" + device->Path() + ",reconnect=off", "--config",
                  TestConfiguration(""), "--no-store"});
  ASSERT_TRUE(run.AwaitErrors("commands attach at")) << run.Errors();
  device.reset();
  EXPECT_EQ(run.Output(), "");
  EXPECT_EQ(run.Status(), 6);
}

TEST_F(TermProgram, RefusesModesThatItDoesNotKnow) {
  for (const char* const option : {"--input", "--output", "--ack"}) {
    const auto run = Start("", {option, "bogus"});
    EXPECT_EQ(run->Status(), 2) << option;
  }
}

TEST_F(TermProgram, HelpListsTheKeysAndAnExample) {
  ProgramRun run({"term", "--help"});
  const std::string help = run.Output();
  EXPECT_EQ(run.Status(), 0);
  EXPECT_TRUE(Holds(help, "ctrl-t A       acknowledge all tokens\n")) << help;
  EXPECT_TRUE(Holds(help, "Example: loka term /dev/ttyUSB0 -b 9600")) << help;
}

// The line of the help's example, on a port that is there.
TEST_F(TermProgram, TheExampleOfTheHelpWorks) {
  ProgramRun run({"term", line_.Path(), "-b", "9600", "-p", "none", "--rx-suffix", "CRLF",
                  "--tx-suffix", "CRLF"});
  ASSERT_TRUE(run.Type("R"));
  EXPECT_EQ(DeviceGets(3), "R\r\n");
  ASSERT_TRUE(DeviceSends("1 kg\r\n"));
  EXPECT_EQ(run.Line(), "1 kg");
  EXPECT_EQ(run.Status(), 0);
}

}  // namespace
