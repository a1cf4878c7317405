// SPDX-License-Identifier: Apache-2.0
// The receive tasks of two protocols, reads and writes of every tag, the applying of settings,
// every console command, starts and stops at the same time, for as many seconds as
// LOKA_STRESS_SECONDS says (1 otherwise). Meant for the thread sanitizer; the scripted host
// complains of a wrong order of semaphores, of a use of a released port and of whatever is not
// given back.
#include <atomic>
#include <chrono>
#include <cstdlib>
#include <functional>
#include <shared_mutex>
#include <thread>
#include <vector>

#include "tests/plugin/ConsoleFixture.h"

namespace {

std::chrono::seconds StressTime() {
  const char* seconds = std::getenv("LOKA_STRESS_SECONDS");
  return std::chrono::seconds(seconds == nullptr ? 1 : std::atoi(seconds));
}

class EverythingAtOnceTest : public ConsoleFixture {
 protected:
  void SetUp() override {
    ConsoleFixture::SetUp();
    host_.MultiTask().SetThreaded(true);
    host_.Log().SetRecording(false);
  }

  // Repeats each action on a thread of its own until the time is up.
  static void Repeat(const std::vector<std::function<void(unsigned round)>>& actions) {
    std::atomic<bool> isOver{false};
    std::vector<std::thread> threads;
    threads.reserve(actions.size());
    for (const auto& action : actions) {
      threads.emplace_back([&isOver, &action] {
        for (unsigned round = 0; !isOver; ++round) action(round);
      });
    }
    std::this_thread::sleep_for(StressTime());
    isOver = true;
    for (std::thread& thread : threads) thread.join();
  }

  template <std::size_t Size>
  static const char* Pick(const char* const (&texts)[Size], unsigned round) {
    return texts[round % Size];
  }

  void ReadAnyTag(ProtocolUnderTest& protocol, unsigned round) {
    static const char* const kUris[] = {
        "0?rx_token?string-300",   "0?rx_token_len?unsignedInt", "0?tokens_available?unsignedInt",
        "0?token_ack?boolean",     "0?tx_token?string-9",        "0?connect?boolean",
        "0?SP_Baud?unsignedInt",   "0?SP_Bits?unsignedByte",     "0?SP_Stop?unsignedByte",
        "0?SP_Par?unsignedByte",   "0?SP_Mode?unsignedByte",     "0?SP_RxPrefix?string-20",
        "0?SP_RxSuffix?string-20", "0?SP_Gap?unsignedInt",       "0?SP_TxPrefix?string-20",
        "0?SP_TxSuffix?string-20", "0?SP_HexTokens?boolean",     "0?SP_TokenQueueSize?unsignedInt",
        "0?SP_Done?boolean"};
    const std::shared_lock<std::shared_mutex> tagsInUse(tagsInUse_);
    ITag* tag = protocol.Tag(Pick(kUris, round));
    ASSERT_NE(tag, nullptr);
    const bool isRead = protocol.Read(tag).result != 0;
    EXPECT_TRUE(isRead || stops_) << tag->GetVarName() << ": " << protocol.Error();
    protocol->FreeTag(tag);
  }

  void WriteAnyTag(ProtocolUnderTest& protocol, unsigned round) {
    static const struct {
      const char* uri;
      const char* value;
    } kWrites[] = {{"0?token_ack?boolean", "\1"},
                   {"0?tx_token?string-6", "4142"},
                   {"0?connect?boolean", "\0"},
                   {"0?connect?boolean", "\1"},
                   {"0?SP_Baud?unsignedInt", "\x80\x25\0"},
                   {"0?SP_Done?boolean", "\1"},
                   {"0?SP_Baud?unsignedInt", "\x2C\1\0"},
                   {"0?SP_Bits?unsignedByte", "\7"},
                   {"0?SP_Stop?unsignedByte", "\1"},
                   {"0?SP_Par?unsignedByte", "\4"},
                   {"0?SP_Mode?unsignedByte", "\1"},
                   {"0?SP_RxPrefix?string-5", "02"},
                   {"0?SP_RxSuffix?string-5", "03"},
                   {"0?SP_Gap?unsignedInt", "\x0A\0"},
                   {"0?SP_TxPrefix?string-5", "none"},
                   {"0?SP_TxSuffix?string-5", "0D0A"},
                   {"0?SP_HexTokens?boolean", "\1"},
                   {"0?SP_TokenQueueSize?unsignedInt", "\5\0"},
                   {"0?SP_Done?boolean", "\1"},
                   {"0?SP_HexTokens?boolean", "\0"},
                   {"0?no_such_type?boolean", ""}};
    const auto& write = kWrites[round % std::size(kWrites)];
    const std::shared_lock<std::shared_mutex> tagsInUse(tagsInUse_);
    ITag* tag = protocol.Tag(write.uri);
    if (tag == nullptr) return;
    GuardedBuffer value(8);
    std::fill(value.Data(), value.Data() + 8, static_cast<unsigned char>(0));
    std::copy(write.value, write.value + std::char_traits<char>::length(write.value),
              value.Chars());
    protocol->Write(tag, value.Data());  // may be refused: the port opens and closes meanwhile
    protocol->FreeTag(tag);
  }

  void AnyConsoleCommand(ProtocolUnderTest& protocol, unsigned round) {
    static const char* const kCommands[] = {"help",
                                            "info",
                                            "xml",
                                            "lasterror",
                                            "getmaxtm",
                                            "read 0?rx_token?string-300",
                                            "read 0?SP_RxPrefix?string-20",
                                            "write 0?token_ack?boolean 01",
                                            "write 0?SP_Done?boolean 01",
                                            "read nonsense",
                                            "connect OFF",
                                            "get_stat",
                                            "connect ON",
                                            "put 4142",
                                            "get",
                                            "get_token_length",
                                            "tokens_available",
                                            "token_ack",
                                            "token_ack all",
                                            "set_hexToken ON",
                                            "set_rxGap 20",
                                            "set_rxPrefix 0202",
                                            "set_rxSuffix 0D0A",
                                            "set_txPrefix 02",
                                            "set_txSuffix 03",
                                            "set_hexToken OFF",
                                            "set_rxPrefix 02",
                                            "set_rxSuffix none",
                                            "deletetags",
                                            "connect ON"};
    const std::string command = Pick(kCommands, round);
    if (command == "deletetags") {
      // Nobody may use a tag that this destroys.
      const std::unique_lock<std::shared_mutex> noTagInUse(tagsInUse_);
      GuardedBuffer reply(8);
      EXPECT_TRUE(protocol->DoCommand(command.c_str(), reply.Chars(), 8));
      return;
    }
    GuardedBuffer reply(2000);
    protocol->DoCommand(command.c_str(), reply.Chars(), 2000);
    EXPECT_TRUE(reply.AreGuardsIntact()) << command;
  }

  void FeedLine(const char* port) {
    host_.Line(port).Feed(
        "\x02"
        "4142\x03\x02\x02xyz\x03\r\n");
    std::this_thread::sleep_for(std::chrono::microseconds(50));
  }

  std::shared_mutex tagsInUse_;
  bool stops_ = false;  // the protocols are stopped on the way, so reads may be refused
};

TEST_F(EverythingAtOnceTest, NothingBreaks) {
  Run("token_queue_size=20 gap=5");
  Repeat({[this](unsigned) { FeedLine("com1"); },
          [this](unsigned round) { ReadAnyTag(P(), round); },
          [this](unsigned round) { WriteAnyTag(P(), round); },
          [this](unsigned round) { AnyConsoleCommand(P(), round); },
          [this](unsigned) { EXPECT_NE(P().ComParams().find("com1,"), std::string::npos); }});
}

TEST_F(EverythingAtOnceTest, TwoProtocolsThatAreStartedAndStopped) {
  stops_ = true;
  Run("token_queue_size=20 gap=5");
  ProtocolUnderTest other(plugin_);
  other->SetIdent("other");
  ASSERT_TRUE(other.Config(
      "CfgVer=1 model=1 port=com2 baudrate=300 parity=none bits=7 stopbits=2 mode=RS-485 "
      "rx_suffix=03 token_queue_size=20 gap=5"));
  ASSERT_NE(other->Start(), 0);
  const auto start = [](ProtocolUnderTest& protocol, unsigned round) {
    EXPECT_NE(protocol->Stop(), 0);
    if (round % 3 == 0) std::this_thread::yield();
    protocol->Start();  // may find the port already taken away again
  };
  Repeat({[this](unsigned) {
            FeedLine("com1");
            FeedLine("com2");
          },
          [this](unsigned round) { ReadAnyTag(P(), round); },
          [&](unsigned round) { WriteAnyTag(round % 2 == 0 ? P() : other, round / 2); },
          [&](unsigned round) { ReadAnyTag(other, round); },
          [&](unsigned round) { AnyConsoleCommand(round % 2 == 0 ? P() : other, round / 2); },
          [&](unsigned round) { start(round % 2 == 0 ? P() : other, round); }});
  other->Stop();
}

// Protocols that come and go, most of them started, while others work.
TEST_F(EverythingAtOnceTest, StartedProtocolsAreDeleted) {
  Run("gap=5");
  Repeat({[this](unsigned) { FeedLine("com1"); },
          [this](unsigned round) { ReadAnyTag(P(), round); },
          [this](unsigned round) {
            ProtocolUnderTest passing(plugin_);
            EXPECT_TRUE(passing.Config(Mandatory("rx_suffix=03 gap=5")));
            const bool isStarted = round % 4 == 0 || passing->Start() != 0;
            EXPECT_TRUE(isStarted);
            passing.Tag("0?rx_token?string-9");
            passing.Tag("0?SP_Gap?unsignedInt");
          }});
}

// The host lets the module go while a protocol is still there: nothing works as it should any more,
// and nothing breaks.
TEST_F(ProtocolFixture, AHostThatClosesTheModuleEarly) {
  Run("rx_suffix=03");
  host_.Line().Feed("A\x03");
  host_.RunUntilSilent();
  plugin_.Close();
  host_.Line().Feed("B\x03");
  host_.RunUntilSilent();
  EXPECT_EQ(P().TakeTokens(), "[A][B]");
  EXPECT_TRUE(P().WriteText("tx_token", "x"));
  EXPECT_TRUE(P().WriteNumber("SP_Baud", 300));
  EXPECT_TRUE(P().WriteFlag("SP_Done", 1));
  EXPECT_EQ(host_.Storage().Dump(), "") << "stored into a storage that was given back";
  EXPECT_TRUE(P().WriteFlag("connect", 0));
  EXPECT_TRUE(P().WriteFlag("connect", 1));
  GuardedBuffer info(200);
  EXPECT_GT(P()->GetInfo(info.Chars(), 200), 0);
  EXPECT_NE(P()->Stop(), 0);
  EXPECT_NE(P()->Start(), 0);
  // A protocol that is made now has no services at all.
  ProtocolUnderTest late(plugin_);
  EXPECT_TRUE(late.Config(Mandatory("rx_suffix=03")));
  EXPECT_EQ(late->Start(), 0);
  EXPECT_EQ(late.Error(), "-1 Can't open serial port");
  EXPECT_NE(late->Stop(), 0);
}

}  // namespace
