// SPDX-License-Identifier: Apache-2.0
// Real threads: the receive task beside host threads that read, write, stage, apply, connect, start
// and stop. Meant for the thread sanitizer; without it the order of tokens and the host's rules are
// still checked.
#include <atomic>
#include <chrono>
#include <functional>
#include <thread>
#include <vector>

#include "tests/plugin/PluginFixture.h"

namespace {

class ConcurrencyTest : public ProtocolFixture {
 protected:
  void SetUp() override {
    ProtocolFixture::SetUp();
    host_.MultiTask().SetThreaded(true);
    host_.Log().SetRecording(false);
  }
  void TearDown() override {
    for (const char* port : {"com1", "com2"}) host_.Line(port).LetGo();
    ProtocolFixture::TearDown();
  }

  // Runs the actions at the same time, each `rounds` times, and waits for them.
  static void Together(int rounds, const std::vector<std::function<void(int)>>& actions) {
    std::vector<std::thread> threads;
    threads.reserve(actions.size());
    for (const auto& action : actions) {
      threads.emplace_back([rounds, &action] {
        for (int round = 0; round < rounds; ++round) action(round);
      });
    }
    for (std::thread& thread : threads) thread.join();
  }

  // Values through tags that exist before the threads do.
  struct Tags {
    explicit Tags(ProtocolUnderTest& protocol)
        : available(protocol.Tag("0?tokens_available?unsignedInt")),
          token(protocol.Tag("0?rx_token?string-40")),
          length(protocol.Tag("0?rx_token_len?unsignedInt")),
          acknowledge(protocol.Tag("0?token_ack?boolean")),
          send(protocol.Tag("0?tx_token?string-8")),
          connect(protocol.Tag("0?connect?boolean")),
          baud(protocol.Tag("0?SP_Baud?unsignedInt")),
          parity(protocol.Tag("0?SP_Par?unsignedByte")),
          prefix(protocol.Tag("0?SP_RxPrefix?string-9")),
          suffix(protocol.Tag("0?SP_RxSuffix?string-9")),
          sendPrefix(protocol.Tag("0?SP_TxPrefix?string-9")),
          gap(protocol.Tag("0?SP_Gap?unsignedInt")),
          hex(protocol.Tag("0?SP_HexTokens?boolean")),
          size(protocol.Tag("0?SP_TokenQueueSize?unsignedInt")),
          done(protocol.Tag("0?SP_Done?boolean")) {}
    const ITag* available;
    const ITag* token;
    const ITag* length;
    const ITag* acknowledge;
    const ITag* send;
    const ITag* connect;
    const ITag* baud;
    const ITag* parity;
    const ITag* prefix;
    const ITag* suffix;
    const ITag* sendPrefix;
    const ITag* gap;
    const ITag* hex;
    const ITag* size;
    const ITag* done;
  };

  static std::string Number(unsigned value) {
    std::string bytes;
    for (unsigned shift = 0; shift < 32; shift += 8) {
      bytes += static_cast<char>(static_cast<unsigned char>(value >> shift));
    }
    return bytes;
  }
};

TEST_F(ConcurrencyTest, TokensArriveInOrderWhileTagsAreReadAndWritten) {
  ASSERT_TRUE(P().Config(Mandatory("rx_prefix=02 rx_suffix=03 token_queue_size=10000")));
  ASSERT_NE(P()->Start(), 0);
  const Tags tags(P());
  constexpr int kTokens = 400;
  std::atomic<int> next{0};
  std::thread reader([&] {
    while (next < kTokens) {
      if (P().Read(tags.available).bytes == Number(0)) {
        std::this_thread::yield();
        continue;
      }
      const std::string bytes = P().Read(tags.token).bytes;
      EXPECT_EQ(bytes.substr(0, bytes.find('\0')), "token " + std::to_string(next));
      EXPECT_TRUE(P().Write(tags.acknowledge, "\1"));
      ++next;
    }
  });
  Together(kTokens, {[&](int i) { host_.Line().Feed("\x02token " + std::to_string(i) + "\x03"); },
                     [&](int) { EXPECT_TRUE(P().Write(tags.send, "x")); },
                     [&](int) {
                       EXPECT_NE(P().Read(tags.length).result, 0);
                       EXPECT_EQ(P().Read(tags.connect).bytes, "\1");
                       EXPECT_EQ(P()->GetLastError(), 1);
                     }});
  reader.join();
  P()->Stop();
}

TEST_F(ConcurrencyTest, SettingsAreStagedReadAndAppliedWhileTokensArrive) {
  ASSERT_TRUE(P().Config(Mandatory("rx_suffix=03")));
  ASSERT_NE(P()->Start(), 0);
  const Tags tags(P());
  Together(120, {[&](int i) {
                   host_.Line().Feed(std::string(static_cast<std::size_t>(i % 7), 'A') + "\x03");
                 },
                 [&](int i) {
                   EXPECT_TRUE(P().Write(tags.baud, Number(i % 2 != 0 ? 9600 : 19200)));
                   EXPECT_TRUE(P().Write(tags.prefix, i % 2 != 0 ? "02" : "none"));
                   EXPECT_TRUE(P().Write(tags.suffix, i % 2 != 0 ? "03" : "0304"));
                   EXPECT_TRUE(P().Write(tags.sendPrefix, i % 2 != 0 ? "02030405" : ""));
                 },
                 [&](int i) {
                   EXPECT_TRUE(P().Write(tags.gap, Number(static_cast<unsigned>(i))));
                   EXPECT_TRUE(P().Write(tags.hex, std::string(1, static_cast<char>(i % 2))));
                   EXPECT_TRUE(P().Write(tags.size, Number(static_cast<unsigned>(i))));
                   EXPECT_TRUE(P().Write(tags.parity, std::string(1, static_cast<char>(i % 5))));
                 },
                 [&](int) { EXPECT_TRUE(P().Write(tags.done, "\1")); },
                 [&](int) {
                   P().Read(tags.baud);
                   P().Read(tags.prefix);
                   P().Read(tags.suffix);
                   P().Read(tags.hex);
                   P().Read(tags.gap);
                   P().Read(tags.size);
                   P().Read(tags.parity);
                   EXPECT_NE(P().ComParams().find("com1,"), std::string::npos);
                 },
                 [&](int) {
                   P().Read(tags.available);
                   P().Read(tags.token);
                   P().Write(tags.acknowledge, "\1");
                   P().Write(tags.send, "4142");
                 }});
  P()->Stop();
}

TEST_F(ConcurrencyTest, ConnectSwitchBesideSendsAndReceives) {
  ASSERT_TRUE(P().Config(Mandatory("rx_suffix=03")));
  ASSERT_NE(P()->Start(), 0);
  const Tags tags(P());
  Together(100,
           {[&](int) { host_.Line().Feed("ABC\x03"); },
            [&](int) { P().Write(tags.connect, std::string(1, '\0')); },
            [&](int) { P().Write(tags.connect, "\1"); }, [&](int) { P().Write(tags.send, "x"); },
            [&](int) {
              P().Read(tags.connect);
              P().Write(tags.baud, Number(300));
              P().Write(tags.done, "\1");
            }});
  P()->Stop();
}

TEST_F(ConcurrencyTest, ADisconnectGetsThroughAHundredTimes) {
  ASSERT_TRUE(P().Config(Mandatory("rx_suffix=03")));
  ASSERT_NE(P()->Start(), 0);
  const Tags tags(P());
  for (int i = 0; i < 100; ++i) {
    EXPECT_TRUE(P().Write(tags.connect, std::string(1, '\0')));
    EXPECT_TRUE(P().Write(tags.connect, "\1"));
  }
  P()->Stop();
}

TEST_F(ConcurrencyTest, StartAndStopFromSeveralThreads) {
  ASSERT_TRUE(P().Config(Mandatory("rx_suffix=03")));
  const Tags tags(P());
  Together(30, {[&](int) { P()->Start(); }, [&](int) { P()->Stop(); },
                [&](int) {
                  P()->Start();
                  P()->Stop();
                },
                [&](int) {
                  host_.Line().Feed("A\x03");
                  P().Read(tags.available);
                  P().Write(tags.send, "x");
                  P().Write(tags.connect, "\1");
                  P().Write(tags.done, "\1");
                  P().ComParams();
                }});
  P()->Stop();
}

// A start that found the driver still started would answer 1 for a driver that stops.
TEST_F(ConcurrencyTest, AStartInTheMiddleOfAStopWaitsForItsEnd) {
  constexpr auto kTimeForAWrongAnswer = std::chrono::milliseconds(100);
  ASSERT_TRUE(P().Config(Mandatory("rx_suffix=03")));
  ASSERT_NE(P()->Start(), 0);
  std::thread starter;
  host_.MultiTask().OnNextStop([&] {
    starter = std::thread([&] { EXPECT_NE(P()->Start(), 0); });
    std::this_thread::sleep_for(kTimeForAWrongAnswer);
  });
  EXPECT_NE(P()->Stop(), 0);
  ASSERT_TRUE(starter.joinable());
  starter.join();
  EXPECT_TRUE(host_.MultiTask().LastTask()->IsStarted());
  EXPECT_FALSE(host_.MultiTask().LastTask()->IsAskedToEnd());
}

TEST_F(ConcurrencyTest, TagsComeAndGoWhileTheTaskRuns) {
  ASSERT_TRUE(P().Config(Mandatory("rx_suffix=03")));
  ASSERT_NE(P()->Start(), 0);
  Together(100, {[&](int) { host_.Line().Feed("A\x03"); },
                 [&](int) {
                   ITag* tag = P().Tag("0?rx_token?string-40");
                   P().Read(tag);
                   P()->FreeTag(tag);
                 }});
  P()->Stop();
}

TEST_F(ConcurrencyTest, TwoProtocolsRunSideBySide) {
  ASSERT_TRUE(P().Config(Mandatory("rx_suffix=03 token_queue_size=1000")));
  ProtocolUnderTest other(plugin_);
  other->SetIdent("other");
  ASSERT_TRUE(other.Config(
      "CfgVer=1 model=1 port=com2 baudrate=300 parity=none bits=7 stopbits=2 mode=RS-485 "
      "rx_suffix=03 token_queue_size=1000"));
  ASSERT_NE(P()->Start(), 0);
  ASSERT_NE(other->Start(), 0);
  const Tags tags(P());
  const Tags otherTags(other);
  Together(100, {[&](int) { host_.Line("com1").Feed("one\x03"); },
                 [&](int) { host_.Line("com2").Feed("two\x03"); },
                 [&](int) {
                   P().Read(tags.token);
                   P().Write(tags.baud, Number(300));
                   P().Write(tags.send, "x");
                 },
                 [&](int) {
                   other.Read(otherTags.token);
                   other.Write(otherTags.baud, Number(600));
                   other.Write(otherTags.send, "x");
                 }});
  const auto waitFor = [](ProtocolUnderTest& protocol, unsigned count) {
    while (protocol.ReadNumber("tokens_available") != count) std::this_thread::yield();
  };
  waitFor(P(), 100);
  waitFor(other, 100);
  EXPECT_EQ(P().ReadText("rx_token"), "one");
  EXPECT_EQ(other.ReadText("rx_token"), "two");
  P()->Stop();
  other->Stop();
}

// The receive task stands in a receive, and with it the port semaphore is taken.
class HeldReceiveTest : public ConcurrencyTest {
 protected:
  void SetUp() override {
    ConcurrencyTest::SetUp();
    ASSERT_TRUE(P().Config(Mandatory("rx_suffix=03 tx_prefix=02")));
    host_.Line().HoldAtEnd();
    ASSERT_NE(P()->Start(), 0);
    host_.Line().WaitUntilHeld();
    ASSERT_TRUE(host_.MultiTask().Semaphore("port")->IsHeld());
    host_.Log().SetRecording(true);
    host_.Log().Take();
  }
};

TEST_F(HeldReceiveTest, ATokenIsSentMeanwhile) {
  EXPECT_TRUE(P().WriteText("tx_token", "A"));
  EXPECT_EQ(Calls(), "queue.Lock\nSend 02 41\nqueue.Unlock\n");
}

TEST_F(HeldReceiveTest, SettingsAreAppliedMeanwhile) {
  EXPECT_TRUE(P().WriteNumber("SP_Baud", 300));
  EXPECT_TRUE(P().WriteFlag("SP_Done", 1));
  EXPECT_EQ(Calls(), "queue.Lock\nSetInteger LOKA baud 300\nSetup 300 1 8 1 0\nqueue.Unlock\n");
}

TEST_F(HeldReceiveTest, TagsAreReadMeanwhile) {
  EXPECT_EQ(P().ReadNumber("tokens_available"), 0U);
  EXPECT_TRUE(P().ReadFlag("connect"));
}

TEST_F(HeldReceiveTest, ADisconnectWaitsForTheReceive) {
  std::thread disconnect([this] { EXPECT_TRUE(P().WriteFlag("connect", 0)); });
  while (!host_.MultiTask().Semaphore("queue")->IsHeld()) std::this_thread::yield();
  EXPECT_EQ(host_.Log().Count("ReleasePort com1"), 0);
  host_.Line().LetGo();
  disconnect.join();
  EXPECT_EQ(host_.Log().Count("ReleasePort com1"), 1);
  EXPECT_FALSE(P().ReadFlag("connect"));
}

TEST_F(HeldReceiveTest, AStopThatCannotEndTheTaskLeavesItsPortAlone) {
  host_.Faults().FailNth("StopTask", 1);
  EXPECT_NE(P()->Stop(), 0);
  EXPECT_EQ(P().Read(P().Tag("0?connect?boolean")).result, 0) << "stopped all the same";
  host_.Line().LetGo();
  // The port is given back in the end, and never while the receive is inside it (which the host
  // notes as a violation).
  P().Delete();
  EXPECT_EQ(host_.Log().Count("ReleasePort com1"), 1);
}

TEST_F(HeldReceiveTest, AStartAfterSuchAStop) {
  host_.Faults().FailNth("StopTask", 1);
  EXPECT_NE(P()->Stop(), 0);
  EXPECT_NE(P()->Start(), 0);
  EXPECT_EQ(host_.Log().Count("CreateTask 3"), 0) << "the old task is still there";
  EXPECT_TRUE(P().WriteText("tx_token", "A"));
  host_.Line().LetGo();
  EXPECT_NE(P()->Stop(), 0);
}

TEST_F(HeldReceiveTest, DeleteWhileStarted) {
  host_.Line().LetGo();
  host_.Line().Feed(
      "A\x03"
      "B\x03");
  P().Delete();
  EXPECT_EQ(host_.Log().Count("ReleasePort com1"), 1);
}

}  // namespace
