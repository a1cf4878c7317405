// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>
#include <sys/ioctl.h>
#include <termios.h>

#include "host/sim/DevicePort.h"
#include "tests/host/sim/HostEnd.h"
#include "tests/host/support/TestLimit.h"

namespace {

constexpr std::size_t kAny = 1;

TEST(DevicePort, SeesWhoOpensAndClosesIt) {
  DevicePort port;
  EXPECT_FALSE(port.IsPlugged());
  EXPECT_FALSE(port.IsOpen());
  port.Plug();
  EXPECT_FALSE(port.IsOpen());
  EXPECT_EQ(port.Write("lost"), 0U);
  for (int round = 0; round < 3; ++round) {
    HostEnd host(port.Path());
    ASSERT_TRUE(host.IsOpen());
    EXPECT_TRUE(port.IsOpen());
    EXPECT_EQ(port.Write("AB"), 2U);
    EXPECT_EQ(host.Read(2, kLimitMs), "AB");
    ASSERT_TRUE(host.Write("last words"));
    host.Close();
    EXPECT_FALSE(port.IsOpen());
    EXPECT_EQ(port.Read(), "last words");
    EXPECT_EQ(port.Read(), "");
  }
}

TEST(DevicePort, IsRawAndStaysSo) {
  DevicePort port;
  port.Plug();
  const HostEnd host(port.Path());
  const std::string all = "\x01\x03\x04\r\n\x11\x13\x1A\x7F\xFF";
  EXPECT_EQ(port.Write(all), all.size());
  EXPECT_EQ(host.Read(all.size(), kLimitMs), all);
  ASSERT_TRUE(host.Write(all));
  EXPECT_EQ(port.Read(), all);
}

TEST(DevicePort, NeverWaitsForAHostThatDoesNotRead) {
  constexpr std::size_t kMuch = 1000000;
  DevicePort port;
  port.Plug();
  const HostEnd host(port.Path());
  const std::size_t taken = port.Write(std::string(kMuch, 'x'));
  EXPECT_GT(taken, 0U);
  EXPECT_LT(taken, kMuch);
  EXPECT_EQ(host.Read(taken, kLimitMs).size(), taken);
}

TEST(DevicePort, FlushDropsWhatAHostLeftUnread) {
  DevicePort port;
  port.Plug();
  {
    const HostEnd host(port.Path());
    EXPECT_EQ(port.Write("old"), 3U);
  }
  EXPECT_TRUE(port.Flush());
  const HostEnd host(port.Path());
  EXPECT_EQ(port.Write("new"), 3U);
  EXPECT_EQ(host.Read(3, kLimitMs), "new");
}

TEST(DevicePort, UnpluggingHangsUpAndPluggingMakesANewPort) {
  DevicePort port;
  port.Plug();
  const HostEnd host(port.Path());
  port.Unplug();
  EXPECT_FALSE(port.IsPlugged());
  EXPECT_EQ(port.Path(), "");
  EXPECT_EQ(port.Write("A"), 0U);
  EXPECT_EQ(port.Read(), "");
  EXPECT_EQ(host.Read(kAny, kLimitMs), "");
  port.Plug();
  const HostEnd again(port.Path());
  EXPECT_EQ(port.Write("AB"), 2U);
  EXPECT_EQ(again.Read(2, kLimitMs), "AB");
}

TEST(DevicePort, DrainEndsWhenEverythingIsReadOrNobodyIsThere) {
  DevicePort port;
  port.Plug();
  const Deadline deadline = Deadline::After(kLimitMs);
  port.Drain(deadline);
  HostEnd host(port.Path());
  EXPECT_EQ(port.Write("AB"), 2U);
  EXPECT_EQ(host.Read(2, kLimitMs), "AB");
  port.Drain(deadline);
  EXPECT_EQ(port.Write("unread"), 6U);
  host.Close();
  port.Drain(deadline);
  EXPECT_FALSE(deadline.HasPassed());
}

TEST(DevicePort, DrainGivesUpAtItsDeadline) {
  DevicePort port;
  port.Plug();
  const HostEnd host(port.Path());
  EXPECT_EQ(port.Write("unread"), 6U);
  const Deadline deadline = Deadline::After(30);
  port.Drain(deadline);
  EXPECT_TRUE(deadline.HasPassed());
  EXPECT_EQ(host.Read(6, kLimitMs), "unread");
}

}  // namespace
