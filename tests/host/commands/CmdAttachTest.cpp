// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "tests/host/commands/InstanceRun.h"
#include "tests/host/support/TestLimit.h"
#include "tests/host/support/TextParts.h"

namespace {

TEST(CmdAttached, ReachesTheRunningDriver) {
  InstanceRun instance("rx_suffix=03 tx_suffix=0D");
  ASSERT_TRUE(instance.IsReady()) << instance.Errors();
  const InstanceRun::Result status = instance.Loka({"cmd", "get_stat"});
  EXPECT_EQ(status.status, 0);
  EXPECT_EQ(status.output, "Connected\n");
  EXPECT_TRUE(Holds(status.errors, "attached to the running instance com1")) << status.errors;
  ASSERT_TRUE(instance.DeviceSends("AB\x03", "1"));
  EXPECT_EQ(instance.Output({"cmd", "get"}), "AB\n");
  EXPECT_EQ(instance.Output({"cmd", "token_ack"}), "OK\n");
  EXPECT_EQ(instance.Output({"cmd", "put", "hello", "world"}), "OK\n");
  std::string sent;
  EXPECT_TRUE(instance.Line().Receive(12, Deadline::After(kLimitMs), &sent));
  EXPECT_EQ(sent, "hello world\r");
  EXPECT_TRUE(Holds(instance.Errors(), "console \"get_stat\": Connected")) << instance.Errors();
}

TEST(CmdAttached, SaysThatASettingOfTheConsoleIsNotStored) {
  InstanceRun instance("gap=20");
  ASSERT_TRUE(instance.IsReady()) << instance.Errors();
  const InstanceRun::Result set = instance.Loka({"cmd", "set_rxGap", "50"});
  EXPECT_EQ(set.output, "OK\n");
  EXPECT_TRUE(Holds(set.errors, "never stored; loka set keeps a setting")) << set.errors;
  EXPECT_EQ(instance.Output({"store", "ls"}), "");
  const InstanceRun::Result shown = instance.Loka({"set"});
  EXPECT_TRUE(Holds(shown.output, "gap               20          20      -       -\n"))
      << shown.output;
  EXPECT_TRUE(Holds(shown.errors, "gap 50, set on the console, is in effect until SP_Done"))
      << shown.errors;
}

TEST(CmdAttached, RefusalsHaveTheDriversText) {
  InstanceRun instance("");
  ASSERT_TRUE(instance.IsReady()) << instance.Errors();
  const InstanceRun::Result connect = instance.Loka({"cmd", "connect", "on"});
  EXPECT_EQ(connect.status, 1);
  EXPECT_EQ(connect.output, "");
  EXPECT_TRUE(Holds(connect.errors, "ERROR: wrong value")) << connect.errors;
  const InstanceRun::Result unknown = instance.Loka({"cmd", "bogus"});
  EXPECT_EQ(unknown.status, 1);
  EXPECT_TRUE(Holds(unknown.errors, "does not know the command 'bogus'")) << unknown.errors;
}

TEST(CmdAttached, OptionsChooseTheInstance) {
  InstanceRun instance("");
  ASSERT_TRUE(instance.IsReady()) << instance.Errors();
  EXPECT_EQ(instance.Output({"cmd", "--instance", "com1", "get_stat"}), "Connected\n");
  EXPECT_EQ(instance.Loka({"cmd", "--instance", "com2", "get_stat"}).status, 5);
  EXPECT_EQ(instance.Loka({"cmd", "--no-attach", "get_stat"}).status, 2);
  EXPECT_EQ(instance.Loka({"cmd", "--no-attach", "--instance", "com1", "get_stat"}).status, 2);
  // Another device is another driver.
  const PseudoTerminal other;
  const InstanceRun::Result own =
      instance.Loka({"cmd", other.Path(), "--config", TestConfiguration("autoConnect=false"),
                     "--no-store", "get_stat"});
  EXPECT_EQ(own.output, "Disconnected\n");
  EXPECT_TRUE(Holds(own.errors, "started for this command only")) << own.errors;
}

}  // namespace
