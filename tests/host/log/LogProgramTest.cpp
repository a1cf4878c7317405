// SPDX-License-Identifier: Apache-2.0
// --log of the commands that have it.
#include <gtest/gtest.h>

#include <fstream>
#include <iterator>

#include "host/port/PseudoTerminal.h"
#include "tests/host/support/PluginConfiguration.h"
#include "tests/host/support/ProgramRun.h"

namespace {

constexpr const char* kTokenLine = "Z com1 token 1  \"A\"  1 bytes\n";

class LogProgram : public testing::Test {
 protected:
  std::vector<std::string> With(std::vector<std::string> arguments) const {
    arguments.insert(arguments.end(), {line_.Path(), "--config", TestConfiguration("rx_suffix=03"),
                                       "--no-attach", "--no-store", "--log", folder_.File("log")});
    return arguments;
  }
  std::string Log() const {
    std::ifstream file(folder_.File("log"));
    return {std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>()};
  }
  bool DeviceSends(const std::string& bytes) const {
    return line_.Send(bytes, Deadline::After(ProgramRun::kLimitMs));
  }

  const PseudoTerminal line_;
  const TemporaryFolder folder_;
};

TEST_F(LogProgram, SubLogsWhatItPrints) {
  ASSERT_TRUE(DeviceSends("A\x03"));
  ProgramRun run(With({"sub", "-C", "1"}));
  EXPECT_EQ(run.Output(), "A\n");
  EXPECT_EQ(run.Status(), 0);
  EXPECT_NE(Log().find(kTokenLine), std::string::npos) << Log();
}

TEST_F(LogProgram, RunLogsWhileItRuns) {
  ProgramRun run(With({"run"}));
  ASSERT_TRUE(run.AwaitErrors("commands attach at")) << run.Errors();
  ASSERT_TRUE(DeviceSends("A\x03"));
  const Deadline deadline = Deadline::After(ProgramRun::kLimitMs);
  while (Log().find(kTokenLine) == std::string::npos && !deadline.HasPassed()) {
    Deadline::After(2).Sleep();
  }
  EXPECT_NE(Log().find(kTokenLine), std::string::npos) << Log();
  run.Signal(SIGTERM);
  EXPECT_EQ(run.Status(), 128 + SIGTERM);
}

TEST_F(LogProgram, TermLogsWhatIsSentAndWhatComes) {
  ProgramRun run(With({"term"}));
  ASSERT_TRUE(run.Type("R"));
  std::string bytes;
  ASSERT_TRUE(line_.Receive(1, Deadline::After(ProgramRun::kLimitMs), &bytes));
  ASSERT_TRUE(DeviceSends("A\x03"));
  EXPECT_EQ(run.Line(), "A");
  EXPECT_EQ(run.Status(), 0);
  EXPECT_NE(Log().find("Z com1 tx 52  \"R\"\n"), std::string::npos) << Log();
  EXPECT_NE(Log().find(kTokenLine), std::string::npos) << Log();
}

TEST_F(LogProgram, AFileThatCannotBeOpenedIsStatus1) {
  for (const char* const command : {"sub", "run", "term"}) {
    std::vector<std::string> arguments = With({command});
    arguments.back() = folder_.Path().string();
    ProgramRun run(arguments);
    EXPECT_EQ(run.Status(), 1) << command;
    EXPECT_NE(run.Errors().find("log file: "), std::string::npos) << run.Errors();
  }
}

}  // namespace
