// SPDX-License-Identifier: Apache-2.0
#include <fcntl.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <algorithm>

#include "host/port/PortHolder.h"
#include "host/port/PseudoTerminal.h"
#include "tests/host/port/LockingProcess.h"

namespace {

TEST(PortHolder, FindsAProcessThatHasTheDeviceOpen) {
  const PseudoTerminal line;
  const auto holders = FindPortHolders(line.Path());
  ASSERT_EQ(holders.size(), 1U);
  EXPECT_EQ(holders[0].processId, getpid());
  EXPECT_NE(holders[0].command.find("host_tests"), std::string::npos) << holders[0].command;
}

TEST(PortHolder, NamesTheOwnerOfTheLockBeforeAllOthers) {
  const PseudoTerminal line;
  const LockingProcess other(line.Path());
  const auto holders = FindPortHolders(line.Path());
  ASSERT_EQ(holders.size(), 1U);
  EXPECT_EQ(holders[0].processId, other.ProcessId());
}

TEST(PortHolder, FindsNobodyBehindAFreeOrMissingName) {
  EXPECT_TRUE(FindPortHolders("/dev/does-not-exist").empty());
  std::string path;
  { path = PseudoTerminal().Path(); }
  const PseudoTerminal other;
  if (other.Path() != path) {
    EXPECT_TRUE(FindPortHolders(path).empty());
  }
}

TEST(PortHolder, KnowsTheTerminalOfASession) {
  const PseudoTerminal line;
  EXPECT_FALSE(IsControllingTerminal(line.Path()));
  const SessionProcess login(line.Path());
  EXPECT_TRUE(IsControllingTerminal(line.Path()));
  EXPECT_FALSE(IsControllingTerminal("/dev/null"));
  EXPECT_FALSE(IsControllingTerminal("/dev/does-not-exist"));
}

}  // namespace
