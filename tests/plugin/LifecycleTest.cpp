// SPDX-License-Identifier: Apache-2.0
// From construction to destruction: which host calls are made, in which order, and what a failure
// leaves behind.
#include "tests/plugin/PluginFixture.h"

namespace {

constexpr const char* kNoOverrides =
    "Exists LOKA baud -> 0\nExists LOKA parity -> 0\nExists LOKA bits -> 0\n"
    "Exists LOKA stop -> 0\nExists LOKA mode -> 0\nExists LOKA rx_prefix -> 0\n"
    "Exists LOKA rx_suffix -> 0\nExists LOKA tx_prefix -> 0\nExists LOKA tx_suffix -> 0\n"
    "Exists LOKA gap -> 0\nExists LOKA hex_tokens -> 0\nExists LOKA token_queue_size -> 0\n";

class LifecycleTest : public ProtocolFixture {
 protected:
  static std::string NoOverrides() { return kNoOverrides; }
};

TEST_F(LifecycleTest, ConstructionMakesTwoSemaphores) {
  const ProtocolUnderTest other(plugin_);
  EXPECT_EQ(Calls(), "CreateSemaphore -> queue2\nCreateSemaphore -> port2\n");
}

TEST_F(LifecycleTest, StartStopDelete) {
  ASSERT_TRUE(P().Config(Mandatory()));
  EXPECT_NE(P()->Start(), 0);
  EXPECT_EQ(Calls(),
            NoOverrides() + "OpenPort com1\nSetup 9600 1 8 1 0\nCreateTask 3\ntask.Start\n");
  EXPECT_NE(P()->Stop(), 0);
  EXPECT_EQ(Calls(), "StopTask 1000 -> 1\nReleasePort com1\n");
  P().Delete();
  EXPECT_EQ(Calls(), "DeleteSemaphore queue\nDeleteSemaphore port\n");
}

TEST_F(LifecycleTest, SetupGetsTheConfiguredSettings) {
  ASSERT_TRUE(
      P().Config("CfgVer=1 model=1 port=com16 baudrate=115200 parity=mark bits=7 stopbits=2 "
                 "mode=RS-422"));
  EXPECT_NE(P()->Start(), 0);
  EXPECT_EQ(Calls(), NoOverrides() +
                         "OpenPort com16\nSetup 115200 3 7 2 2\nCreateTask 3\n"
                         "task.Start\n");
}

TEST_F(LifecycleTest, ASecondStartChangesNothing) {
  Run();
  EXPECT_NE(P()->Start(), 0);
  EXPECT_EQ(Calls(), "");
}

TEST_F(LifecycleTest, StopWithoutStart) {
  EXPECT_NE(P()->Stop(), 0);
  EXPECT_EQ(Calls(), "");
  Run();
  EXPECT_NE(P()->Stop(), 0);
  Calls();
  EXPECT_NE(P()->Stop(), 0);
  EXPECT_EQ(Calls(), "");
}

TEST_F(LifecycleTest, StoppedMeansNotStarted) {
  Run();
  const ITag* tag = P().Tag("0?connect?boolean");
  EXPECT_NE(P().Read(tag).result, 0);
  P()->Stop();
  EXPECT_EQ(P().Read(tag).result, 0);
  EXPECT_EQ(P().Error(), "-3 Protocol not started");
}

TEST_F(LifecycleTest, ARestartAsksStorageNothingMore) {
  Run();
  P()->Stop();
  Calls();
  // What has been looked up once is kept, whatever the storage says later.
  host_.Storage().Put("LOKA", "baud", 300);
  EXPECT_NE(P()->Start(), 0);
  EXPECT_EQ(Calls(), "OpenPort com1\nSetup 9600 1 8 1 0\nCreateTask 3\ntask.Start\n");
}

// The first Start keeps what it found, configured values included.
TEST_F(LifecycleTest, AConfigAfterTheFirstStartDoesNotReachTheKeptSettings) {
  Run();
  P()->Stop();
  ASSERT_TRUE(
      P().Config("CfgVer=1 model=1 port=com2 baudrate=300 parity=odd bits=7 stopbits=2 "
                 "mode=RS-485"));
  Calls();
  EXPECT_NE(P()->Start(), 0);
  EXPECT_EQ(Calls(), "OpenPort com2\nSetup 9600 1 8 1 0\nCreateTask 3\ntask.Start\n");
}

TEST_F(LifecycleTest, TheIdentIsTheKeySpace) {
  P()->SetIdent("plant 3");
  host_.Storage().Put("LOKA", "baud", 300);
  host_.Storage().Put("plant 3", "baud", 600);
  ASSERT_TRUE(P().Config(Mandatory()));
  EXPECT_NE(P()->Start(), 0);
  const std::string calls = Calls();
  EXPECT_EQ(calls.substr(0, calls.find("Exists plant 3 parity")),
            "Exists plant 3 baud -> 1\nGetInteger plant 3 baud -> 600\n");
  EXPECT_EQ(P().ComParams(), "com1,600,even,8,1,RS-232");
}

TEST_F(LifecycleTest, WithoutAutoConnectThePortStaysClosed) {
  ASSERT_TRUE(P().Config(Mandatory("autoConnect=false")));
  EXPECT_NE(P()->Start(), 0);
  EXPECT_EQ(Calls(), NoOverrides() + "CreateTask 3\ntask.Start\n");
  host_.RunPasses(2);
  EXPECT_EQ(Calls(),
            "IsToEnd -> 0\nSleep 10\nSleep 0\nIsToEnd -> 0\nSleep 10\nSleep 0\nIsToEnd -> 1\n");
  P()->Stop();
  EXPECT_EQ(Calls(), "StopTask 1000 -> 1\n");
}

// The console may have opened the port before, with other settings: Start opens it as configured
// and overridden.
TEST_F(LifecycleTest, StartOpensAnOpenPortAnew) {
  host_.Storage().Put("LOKA", "baud", 300);
  ASSERT_TRUE(P().Config(Mandatory()));
  char reply[40] = {};
  ASSERT_TRUE(P()->DoCommand("connect ON", reply, sizeof reply));
  EXPECT_EQ(Calls(), "port.Lock\nOpenPort com1\nSetup 9600 1 8 1 0\nport.Unlock\n");
  EXPECT_NE(P()->Start(), 0);
  const std::string calls = Calls();
  EXPECT_EQ(calls.substr(calls.find("ReleasePort")),
            "ReleasePort com1\nOpenPort com1\nSetup 300 1 8 1 0\nCreateTask 3\ntask.Start\n");
  EXPECT_TRUE(P().ReadFlag("connect"));
}

TEST_F(LifecycleTest, AFailedStartLeavesTheLinkClosed) {
  ASSERT_TRUE(P().Config(Mandatory()));
  char reply[40] = {};
  ASSERT_TRUE(P()->DoCommand("connect ON", reply, sizeof reply));
  host_.Faults().FailAlways("Setup");
  EXPECT_EQ(P()->Start(), 0);
  EXPECT_EQ(P().Error(), "-1 Can't open serial port");
  EXPECT_TRUE(P()->DoCommand("get_stat", reply, sizeof reply));
  EXPECT_STREQ(reply, "Disconnected");
}

TEST_F(LifecycleTest, StartWithoutAutoConnectKeepsAnOpenPort) {
  ASSERT_TRUE(P().Config(Mandatory("autoConnect=false")));
  char reply[40] = {};
  ASSERT_TRUE(P()->DoCommand("connect ON", reply, sizeof reply));
  Calls();
  EXPECT_NE(P()->Start(), 0);
  EXPECT_EQ(Calls(), NoOverrides() + "CreateTask 3\ntask.Start\n");
  EXPECT_TRUE(P().ReadFlag("connect"));
}

TEST_F(LifecycleTest, StartWithoutConfig) {
  EXPECT_NE(P()->Start(), 0);
  EXPECT_EQ(Calls(), NoOverrides() + "CreateTask 3\ntask.Start\n");
  EXPECT_EQ(P().ComParams(), ",0,none,0,0,RS-232");
}

TEST_F(LifecycleTest, APortThatCannotBeOpened) {
  ASSERT_TRUE(P().Config(Mandatory()));
  host_.Faults().FailNth("OpenPort", 1);
  EXPECT_EQ(P()->Start(), 0);
  EXPECT_EQ(P().Error(), "-1 Can't open serial port");
  EXPECT_EQ(Calls(), NoOverrides() + "OpenPort com1\n");
  const ITag* tag = P().Tag("0?connect?boolean");
  EXPECT_EQ(P().Read(tag).result, 0);
  EXPECT_EQ(P().Error(), "-3 Protocol not started");
  EXPECT_NE(P()->Stop(), 0);
  EXPECT_EQ(Calls(), "");
  EXPECT_NE(P()->Start(), 0);
  EXPECT_EQ(Calls(), "OpenPort com1\nSetup 9600 1 8 1 0\nCreateTask 3\ntask.Start\n");
}

TEST_F(LifecycleTest, APortThatCannotBeSetUp) {
  ASSERT_TRUE(P().Config(Mandatory()));
  host_.Faults().FailNth("Setup", 1);
  EXPECT_EQ(P()->Start(), 0);
  EXPECT_EQ(P().Error(), "-1 Can't open serial port");
  EXPECT_EQ(Calls(), NoOverrides() + "OpenPort com1\nSetup 9600 1 8 1 0\nReleasePort com1\n");
  EXPECT_NE(P()->Start(), 0);
  EXPECT_TRUE(P().ReadFlag("connect"));
}

TEST_F(LifecycleTest, ATaskThatCannotBeCreated) {
  ASSERT_TRUE(P().Config(Mandatory()));
  host_.Faults().FailNth("CreateTask", 1);
  EXPECT_NE(P()->Start(), 0);
  EXPECT_EQ(Calls(), NoOverrides() + "OpenPort com1\nSetup 9600 1 8 1 0\nCreateTask 3\n");
  EXPECT_TRUE(P().ReadFlag("connect"));
  Calls();
  EXPECT_NE(P()->Stop(), 0);
  EXPECT_EQ(Calls(), "ReleasePort com1\n");
  EXPECT_NE(P()->Start(), 0);
  EXPECT_EQ(Calls(), "OpenPort com1\nSetup 9600 1 8 1 0\nCreateTask 3\ntask.Start\n");
}

TEST_F(LifecycleTest, ATaskThatDoesNotStop) {
  Run();
  host_.Faults().FailAlways("StopTask");
  EXPECT_NE(P()->Stop(), 0);
  EXPECT_EQ(Calls(), "StopTask 1000 -> 0\nReleasePort com1\n");
  EXPECT_NE(P()->Start(), 0);
  EXPECT_EQ(Calls(), "OpenPort com1\nSetup 9600 1 8 1 0\n");
  EXPECT_TRUE(P().ReadFlag("connect"));
  Calls();
  host_.Faults().Clear();
  EXPECT_NE(P()->Stop(), 0);
  EXPECT_EQ(Calls(), "StopTask 1000 -> 1\nReleasePort com1\n");
}

TEST_F(LifecycleTest, DeleteAfterATaskThatDidNotStop) {
  Run();
  host_.Faults().FailNth("StopTask", 1);
  EXPECT_NE(P()->Stop(), 0);
  Calls();
  P().Delete();
  EXPECT_EQ(Calls(), "StopTask 1000 -> 1\nDeleteSemaphore queue\nDeleteSemaphore port\n");
}

TEST_F(LifecycleTest, DeleteWhileStarted) {
  Run();
  P().Tag("0?connect?boolean");
  P().Delete();
  EXPECT_EQ(Calls(),
            "StopTask 1000 -> 1\nDeleteSemaphore queue\nDeleteSemaphore port\n"
            "ReleasePort com1\n");
}

TEST_F(LifecycleTest, TheQueueOutlivesAStop) {
  Run("rx_suffix=03");
  Receive("A\x03");
  P()->Stop();
  ASSERT_NE(P()->Start(), 0);
  EXPECT_EQ(P().TakeTokens(), "[A]");
}

TEST_F(LifecycleTest, WithoutPermanentStorage) {
  plugin_.Close();
  protocol_.reset();
  host_.SetAbsent("IPermanentStorage");
  ASSERT_EQ(plugin_.Init(&host_), 1);
  protocol_ = std::make_unique<ProtocolUnderTest>(plugin_);
  ASSERT_TRUE(P().Config(Mandatory()));
  Calls();
  EXPECT_NE(P()->Start(), 0);
  EXPECT_EQ(Calls(), "OpenPort com1\nSetup 9600 1 8 1 0\nCreateTask 3\ntask.Start\n");
}

TEST_F(LifecycleTest, TheTaskEndsWhenAsked) {
  Run();
  host_.RunPasses(0);
  EXPECT_EQ(Calls(), "IsToEnd -> 1\n");
  host_.RunPasses(1);
  EXPECT_EQ(Calls(),
            "IsToEnd -> 0\nport.Lock\nReceive 500 -> time-out\nport.Unlock\nSleep 0\n"
            "IsToEnd -> 1\n");
}

}  // namespace
