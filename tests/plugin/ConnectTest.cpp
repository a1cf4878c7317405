// SPDX-License-Identifier: Apache-2.0
// The connect switch: opening and closing the port at run time, and its two odd values.
#include "tests/plugin/PluginFixture.h"

namespace {

class ConnectTest : public ProtocolFixture {
 protected:
  static constexpr const char* kOff =
      "queue.Lock\nport.Lock\nReleasePort com1\nport.Unlock\nqueue.Unlock\n";
  static constexpr const char* kOn =
      "queue.Lock\nport.Lock\nOpenPort com1\nSetup 9600 1 8 1 0\nport.Unlock\nqueue.Unlock\n";
};

TEST_F(ConnectTest, OffAndOn) {
  Run();
  EXPECT_TRUE(P().WriteFlag("connect", 0));
  EXPECT_EQ(Calls(), kOff);
  EXPECT_FALSE(P().ReadFlag("connect"));
  Calls();
  EXPECT_TRUE(P().WriteFlag("connect", 1));
  EXPECT_EQ(Calls(), kOn);
  EXPECT_TRUE(P().ReadFlag("connect"));
}

// The state changes under the port semaphore, not before.
TEST_F(ConnectTest, TheFlagChangesUnderThePortSemaphore) {
  Run();
  ScriptedSemaphore* port = host_.MultiTask().Semaphore("port");
  char reply[40] = {};
  const auto askStatus = [&] { EXPECT_TRUE(P()->DoCommand("get_stat", reply, sizeof reply)); };
  port->BeforeNthLock(1, askStatus);
  EXPECT_TRUE(P().WriteFlag("connect", 0));
  EXPECT_STREQ(reply, "Connected");
  port->BeforeNthLock(1, askStatus);
  EXPECT_TRUE(P().WriteFlag("connect", 1));
  EXPECT_STREQ(reply, "Disconnected");
}

TEST_F(ConnectTest, AnyNonZeroByteIsOn) {
  Run("autoConnect=false");
  for (const unsigned value : {1U, 2U, 0x80U, 0xFFU}) {
    EXPECT_TRUE(P().WriteFlag("connect", value));
    EXPECT_EQ(Calls(), kOn);
    EXPECT_TRUE(P().WriteFlag("connect", 0));
    EXPECT_EQ(Calls(), kOff);
  }
}

TEST_F(ConnectTest, NotBeforeStart) {
  ASSERT_TRUE(P().Config(Mandatory()));
  EXPECT_FALSE(P().WriteFlag("connect", 1));
  EXPECT_EQ(P().Error(), "-3 Protocol not started");
  EXPECT_EQ(Calls(), "");
}

TEST_F(ConnectTest, APortThatCannotBeOpened) {
  Run("autoConnect=false");
  host_.Faults().FailNth("OpenPort", 1);
  EXPECT_FALSE(P().WriteFlag("connect", 1));
  EXPECT_EQ(P().Error(), "-1 Can't open serial port");
  EXPECT_EQ(Calls(), "queue.Lock\nport.Lock\nOpenPort com1\nport.Unlock\nqueue.Unlock\n");
  EXPECT_FALSE(P().ReadFlag("connect"));
  Calls();
  EXPECT_TRUE(P().WriteFlag("connect", 1));
  EXPECT_EQ(Calls(), kOn);
}

TEST_F(ConnectTest, APortThatCannotBeSetUp) {
  Run("autoConnect=false");
  host_.Faults().FailNth("Setup", 1);
  EXPECT_FALSE(P().WriteFlag("connect", 1));
  EXPECT_EQ(P().Error(), "-1 Can't open serial port");
  EXPECT_EQ(Calls(),
            "queue.Lock\nport.Lock\nOpenPort com1\nSetup 9600 1 8 1 0\nReleasePort com1\n"
            "port.Unlock\nqueue.Unlock\n");
  EXPECT_FALSE(P().ReadFlag("connect"));
  EXPECT_TRUE(P().WriteFlag("connect", 1));
}

// Switching on what is on sends the value's byte as a token.
TEST_F(ConnectTest, OnWhileConnectedSendsAToken) {
  Run("tx_prefix=02 tx_suffix=03");
  EXPECT_TRUE(P().WriteFlag("connect", 1));
  EXPECT_EQ(Calls(), "queue.Lock\nSend 02 01 03\nqueue.Unlock\n");
  // The host's value is packed into one bit first.
  EXPECT_TRUE(P().WriteFlag("connect", 200));
  EXPECT_EQ(Calls(), "queue.Lock\nSend 02 01 03\nqueue.Unlock\n");
  EXPECT_TRUE(P().ReadFlag("connect"));
}

TEST_F(ConnectTest, OnWhileConnectedIsNoHexToken) {
  Run("hex_tokens=true");
  EXPECT_FALSE(P().WriteFlag("connect", 1));
  EXPECT_EQ(P().Error(), "-1 token to send must be in hex format");
  EXPECT_EQ(Calls(), "queue.Lock\nqueue.Unlock\n");
  EXPECT_TRUE(P().ReadFlag("connect"));
}

// Switching off what is off is an attempt to send.
TEST_F(ConnectTest, OffWhileDisconnectedFails) {
  for (const char* mode : {"hex_tokens=false", "hex_tokens=true"}) {
    ProtocolUnderTest protocol(plugin_);
    ASSERT_TRUE(protocol.Config(Mandatory(std::string("autoConnect=false ") + mode)));
    ASSERT_NE(protocol->Start(), 0);
    EXPECT_FALSE(protocol.WriteFlag("connect", 0));
    EXPECT_EQ(protocol.Error(), "-1 Serial port not active for sending");
    protocol->Stop();
  }
}

TEST_F(ConnectTest, OffWhileDisconnectedTakesTheQueueSemaphoreOnly) {
  Run("autoConnect=false");
  EXPECT_FALSE(P().WriteFlag("connect", 0));
  EXPECT_EQ(Calls(), "queue.Lock\nqueue.Unlock\n");
}

TEST_F(ConnectTest, TheQueueOutlivesADisconnect) {
  Run("rx_suffix=03");
  Receive("A\x03");
  EXPECT_TRUE(P().WriteFlag("connect", 0));
  EXPECT_TRUE(P().WriteFlag("connect", 1));
  EXPECT_EQ(P().TakeTokens(), "[A]");
}

TEST_F(ConnectTest, StopReleasesAPortThatWasConnectedLater) {
  Run("autoConnect=false");
  EXPECT_TRUE(P().WriteFlag("connect", 1));
  Calls();
  EXPECT_NE(P()->Stop(), 0);
  EXPECT_EQ(Calls(), "StopTask 1000 -> 1\nReleasePort com1\n");
}

TEST_F(ConnectTest, StopAfterADisconnectReleasesNothing) {
  Run();
  EXPECT_TRUE(P().WriteFlag("connect", 0));
  Calls();
  EXPECT_NE(P()->Stop(), 0);
  EXPECT_EQ(Calls(), "StopTask 1000 -> 1\n");
}

TEST_F(ConnectTest, StartConnectsAgainAsConfigured) {
  Run();
  EXPECT_TRUE(P().WriteFlag("connect", 0));
  P()->Stop();
  Calls();
  EXPECT_NE(P()->Start(), 0);
  EXPECT_TRUE(P().ReadFlag("connect"));
}

}  // namespace
