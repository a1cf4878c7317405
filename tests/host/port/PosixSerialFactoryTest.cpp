// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <fstream>

#include "host/port/PortAdvice.h"
#include "host/port/PosixSerialFactory.h"
#include "host/port/PseudoTerminal.h"
#include "interfaces/ISerialPort.h"
#include "tests/host/port/LockingProcess.h"
#include "tests/host/support/TemporaryFolder.h"

namespace {

PortMap MapOf(const std::string& word) {
  PortMap map;
  std::string error;
  EXPECT_TRUE(map.Add(word, &error)) << error;
  return map;
}

std::string Joined(const std::vector<std::string>& lines) {
  std::string text;
  for (const std::string& line : lines) {
    text += line + "\n";
  }
  return text;
}

TEST(PosixSerialFactory, OpensByNameAndTakesBack) {
  const PseudoTerminal line;
  PosixSerialFactory factory(MapOf("com3=" + line.Path()), nullptr);
  ISerialPort* const port = factory.OpenPort("com3");
  ASSERT_NE(port, nullptr);
  EXPECT_EQ(factory.LastProblem().kind, PortProblem::Kind::kNone);
  EXPECT_EQ(factory.PortCount(), 1U);
  factory.ReleasePort(port);
  EXPECT_EQ(factory.PortCount(), 0U);
  // A pointer that is no longer known is ignored, also null.
  factory.ReleasePort(port);
  factory.ReleasePort(nullptr);
  EXPECT_NE(factory.OpenPort("com3"), nullptr);
}

TEST(PosixSerialFactory, NameWithoutAPath) {
  PosixSerialFactory factory(MapOf("com3=/dev/x"), nullptr);
  EXPECT_EQ(factory.OpenPort("com1"), nullptr);
  EXPECT_EQ(factory.OpenPort(nullptr), nullptr);
  EXPECT_EQ(factory.LastProblem().kind, PortProblem::Kind::kNotMapped);
  EXPECT_EQ(Joined(AdviceFor(factory.LastProblem())),
            "com1: no path is given for this port name\n"
            "say which port it is: --port com1=/dev/ttyUSB0\n");
}

TEST(PosixSerialFactory, AbsentPort) {
  PosixSerialFactory factory(MapOf("/dev/does-not-exist"), nullptr);
  EXPECT_EQ(factory.OpenPort("com1"), nullptr);
  EXPECT_EQ(factory.LastProblem().kind, PortProblem::Kind::kAbsent);
  const std::string advice = Joined(AdviceFor(factory.LastProblem()));
  EXPECT_EQ(advice.rfind("/dev/does-not-exist: no such port\n", 0), 0U) << advice;
  EXPECT_NE(advice.find("pseudo-terminal"), std::string::npos) << advice;
}

TEST(PosixSerialFactory, OtherKindsOfFilesAreNotOpened) {
  const TemporaryFolder folder;
  std::ofstream(folder.File("file")) << "x";
  // Opening a pipe with nobody at its other end could block for good.
  ASSERT_EQ(mkfifo(folder.File("pipe").c_str(), 0600), 0);
  for (const std::string& path :
       {folder.File("file"), folder.File("pipe"), std::string("/tmp"), std::string("/dev/null")}) {
    PosixSerialFactory factory(MapOf(path), nullptr);
    EXPECT_EQ(factory.OpenPort("com1"), nullptr) << path;
    EXPECT_EQ(factory.LastProblem().kind, PortProblem::Kind::kNotSerial) << path;
    EXPECT_EQ(Joined(AdviceFor(factory.LastProblem())), path + ": not a serial port\n");
  }
}

TEST(PosixSerialFactory, BusyPortNamesTheProcessThatHoldsIt) {
  const PseudoTerminal line;
  const LockingProcess other(line.Path());
  PosixSerialFactory factory(MapOf(line.Path()), nullptr);
  EXPECT_EQ(factory.OpenPort("com1"), nullptr);
  const PortProblem problem = factory.LastProblem();
  EXPECT_EQ(problem.kind, PortProblem::Kind::kBusy);
  ASSERT_EQ(problem.holders.size(), 1U);
  EXPECT_EQ(problem.holders[0].processId, other.ProcessId());
  const std::string advice = Joined(AdviceFor(problem));
  EXPECT_EQ(
      advice.rfind(
          line.Path() + ": in use\nheld by process " + std::to_string(other.ProcessId()) + " (", 0),
      0U)
      << advice;
}

TEST(PosixSerialFactory, SecondOpenInOneProcessIsRefusedToo) {
  const PseudoTerminal line;
  PosixSerialFactory factory(MapOf(line.Path()), nullptr);
  ISerialPort* const port = factory.OpenPort("com1");
  ASSERT_NE(port, nullptr);
  EXPECT_EQ(factory.OpenPort("com2"), nullptr);
  ASSERT_EQ(factory.LastProblem().holders.size(), 1U);
  EXPECT_EQ(factory.LastProblem().holders[0].processId, getpid());
  factory.ReleasePort(port);
  EXPECT_NE(factory.OpenPort("com2"), nullptr);
}

TEST(PosixSerialFactory, BusyPortOfAnUnknownHolderSaysHowToSeeIt) {
  PortProblem problem;
  problem.kind = PortProblem::Kind::kBusy;
  problem.path = "/dev/ttyS9";
  problem.text = "in use";
  EXPECT_NE(Joined(AdviceFor(problem)).find("sudo fuser -v /dev/ttyS9"), std::string::npos);
}

TEST(PosixSerialFactory, MissingRightsNameTheGroup) {
  PortProblem problem;
  problem.kind = PortProblem::Kind::kNoRights;
  problem.path = "/dev/does-not-exist";
  problem.text = "you are not allowed to open it";
  EXPECT_EQ(Joined(AdviceFor(problem)),
            "/dev/does-not-exist: you are not allowed to open it\n"
            "members of the group dialout may use it; to join:\n"
            "  sudo usermod -aG dialout \"$USER\"    then log in again\n");
  // A pseudo-terminal belongs to the group tty.
  const PseudoTerminal line;
  problem.path = line.Path();
  ASSERT_EQ(chmod(line.Path().c_str(), 0660), 0);
  struct stat status {};
  ASSERT_EQ(stat(line.Path().c_str(), &status), 0);
  const std::string expected = status.st_gid == 0 ? "dialout" : "tty";
  EXPECT_NE(Joined(AdviceFor(problem)).find("usermod -aG " + expected + " "), std::string::npos);
}

TEST(PosixSerialFactory, FailedSetUpIsExplainedAfterTheRelease) {
  const PseudoTerminal line;
  PosixSerialFactory factory(MapOf(line.Path()), nullptr);
  ISerialPort* const port = factory.OpenPort("com1");
  ASSERT_NE(port, nullptr);
  EXPECT_EQ(port->Setup(0, 0, 8, 1, 0), 0);
  factory.ReleasePort(port);
  EXPECT_EQ(factory.LastProblem().kind, PortProblem::Kind::kSettings);
  EXPECT_EQ(factory.LastProblem().text.rfind("baud rate 0 is not one of", 0), 0U);
  EXPECT_EQ(factory.LastProblem().path, line.Path());
}

}  // namespace
