// SPDX-License-Identifier: Apache-2.0
// Arguments and hosts that are not as they should be: every call ends in a clean failure, and
// nothing is written where it does not belong.
#include <sys/resource.h>

#include <climits>
#include <cstdlib>
#include <fstream>

#include "tests/plugin/PluginFixture.h"
#include "tests/support/Sanitized.h"

namespace {

class HostileInputTest : public ProtocolFixture {};

TEST_F(HostileInputTest, NullTags) {
  Run("rx_suffix=03");
  Receive("HELLO\x03");
  Calls();
  GuardedBuffer buffer(32);
  unsigned long long stamp = 42;
  int length = 42;
  const ITag* tag = P().Tag("0?rx_token?string-8");
  const ITag* none[2] = {nullptr, nullptr};
  EXPECT_EQ(P()->Read(nullptr, buffer.Data()), 0);
  EXPECT_EQ(P()->Write(nullptr, buffer.Data()), 0);
  EXPECT_EQ(P()->ReadBlock(nullptr, buffer.Data(), 8), 0);
  EXPECT_EQ(P()->WriteBlock(nullptr, buffer.Data(), 8), 0);
  EXPECT_EQ(P()->readWithTimestamp(nullptr, buffer.Data(), &stamp), 0);
  EXPECT_EQ(P()->readBlockWithTimestamp(nullptr, buffer.Data(), 8, &stamp), 0);
  EXPECT_EQ(P()->readBitBlockWithTimestamp(nullptr, buffer.Data(), 8, &stamp), 0);
  EXPECT_EQ(P()->readArrayItem(nullptr, 0, buffer.Data()), 0);
  EXPECT_EQ(P()->writeArrayItem(nullptr, 0, buffer.Data()), 0);
  EXPECT_FALSE(P()->CanBeOptimized(nullptr, nullptr, false));
  EXPECT_FALSE(P()->CanBeOptimized(tag, nullptr, false));
  EXPECT_FALSE(P()->CanBeOptimized(nullptr, tag, false));
  EXPECT_FALSE(P()->CanAddToDatagram(none, 2, nullptr));
  EXPECT_FALSE(P()->CanAddToDatagram(nullptr, 0, nullptr));
  EXPECT_FALSE(P()->IsBefore(nullptr, tag));
  EXPECT_FALSE(P()->IsBefore(tag, nullptr));
  EXPECT_FALSE(P()->IsAdjacent(nullptr, tag));
  EXPECT_FALSE(P()->IsAdjacent(tag, nullptr));
  EXPECT_EQ(P()->GetNodeID(nullptr), 0);
  EXPECT_EQ(P()->MaxUnusedGap(nullptr), 16777215);
  EXPECT_EQ(P()->getTagUriField(nullptr, 0, &length), nullptr);
  EXPECT_EQ(length, 42);
  EXPECT_EQ(stamp, 42U);
  EXPECT_TRUE(buffer.IsUntouched());
  EXPECT_EQ(Calls(), "");
}

TEST_F(HostileInputTest, NullTexts) {
  EXPECT_EQ(P()->Config(nullptr), 0);
  EXPECT_EQ(P()->GetLastError(), -1);
  EXPECT_EQ(P()->CreateTag(nullptr), nullptr);
  EXPECT_EQ(P()->GetLastError(), -1);
  P()->SetIdent("x");
  P()->SetIdent(nullptr);
  EXPECT_NE(P()->GetIdent(), nullptr);
  EXPECT_EQ(P()->addEventSource(nullptr, nullptr), 0);
  EXPECT_EQ(P()->createAlarm(nullptr), nullptr);
  EXPECT_EQ(P()->createTrend(nullptr), nullptr);
}

TEST_F(HostileInputTest, NullBuffers) {
  Run("rx_suffix=03");
  Receive("HELLO\x03");
  Calls();
  const ITag* token = P().Tag("0?rx_token?string-8");
  const ITag* baud = P().Tag("0?SP_Baud?unsignedInt");
  const ITag* send = P().Tag("0?tx_token?string-8");
  for (const ITag* tag : {token, baud, send}) {
    EXPECT_EQ(P()->Read(tag, nullptr), 0);
    EXPECT_EQ(P()->Write(tag, nullptr), 0);
    EXPECT_EQ(P()->ReadBlock(tag, nullptr, 4), 0);
  }
  EXPECT_EQ(P()->readArrayItem(token, 0, nullptr), 0);
  EXPECT_EQ(P()->writeArrayItem(send, 0, nullptr), 0);
  EXPECT_EQ(Calls().find("Send"), std::string::npos);
  EXPECT_EQ(P()->Extend(0, nullptr), 0);
  EXPECT_EQ(P()->Extend(3, nullptr), 0);
  EXPECT_NE(P()->getTagUriField(token, 0, nullptr), reinterpret_cast<const char*>(1));
}

TEST_F(HostileInputTest, ATimeStampWithoutAPlaceForIt) {
  Run("rx_suffix=03");
  Receive("HELLO\x03");
  const ITag* token = P().Tag("0?rx_token?string-8");
  GuardedBuffer buffer(8);
  P()->readWithTimestamp(token, buffer.Data(), nullptr);
  P()->readBlockWithTimestamp(token, buffer.Data(), 8, nullptr);
  EXPECT_TRUE(buffer.AreGuardsIntact());
}

TEST_F(HostileInputTest, NullConversionArguments) {
  Run();
  const ITag* tag = P().Tag("0?SP_Baud?unsignedInt(swap4)");
  GuardedBuffer buffer(4);
  EXPECT_FALSE(tag->Convert(nullptr, buffer.Data(), true));
  EXPECT_FALSE(tag->Convert(buffer.Data(), nullptr, true));
  EXPECT_FALSE(tag->ConvertVariable(nullptr, nullptr, false));
  EXPECT_FALSE(tag->DoConversion(nullptr, "swap4", true));
  EXPECT_TRUE(buffer.IsUntouched());
}

TEST_F(HostileInputTest, CountsThatOverflow) {
  ASSERT_TRUE(P().Config(Mandatory()));
  for (const char* count : {"4294967296", "4294967297", "4294967301", "18446744073709551617",
                            "2147483648", "99999999999999999999999999999999"}) {
    const ITag* tag = P().Tag(std::string("0?tx_token?string-") + count);
    ASSERT_NE(tag, nullptr);
    EXPECT_EQ(tag->GetVarLength(), INT_MAX) << count;
  }
  // Types that the driver has no place for are refused, whatever their length comes to.
  for (const char* type : {"double-2147483647", "int64-4294967295", "time-999999999",
                           "boolean-99999999999", "binary-2147483648"}) {
    EXPECT_EQ(P().Tag(std::string("0?tx_token?") + type), nullptr);
    EXPECT_EQ(P().Error(),
              std::string("-1 Tag URI error: 0?tx_token?") + type + " - not allowed vado type");
  }
}

TEST_F(HostileInputTest, HugeStringsOnPrefixTypes) {
  Run("tx_prefix=0203");
  const std::string text(20000, 'A');
  EXPECT_FALSE(P().WriteText("SP_TxPrefix", text, 20000));
  EXPECT_EQ(P().Error(), "-1 writing after the end of memory type");
  EXPECT_EQ(P().ReadText("SP_TxPrefix", 20000), "0203");
  const ReadOutcome outcome = P().Read(P().Tag("0?SP_TxPrefix?string-20000"));
  EXPECT_NE(outcome.result, 0);
  EXPECT_EQ(outcome.bytes.substr(9999, 5), std::string("0203\0", 5));
}

TEST_F(HostileInputTest, ShortBlocksOfLongTokens) {
  Run("rx_suffix=03");
  const std::string token(900, 'T');
  Receive(token + "\x03");
  const ITag* tag = P().Tag("0?rx_token?string-1000");
  for (const int length : {1, 2, 127, 128, 129, 899, 900, 901, 1000}) {
    const ReadOutcome outcome = P().ReadBlock(tag, length);
    EXPECT_NE(outcome.result, 0);
    std::string expected = token;
    expected.resize(static_cast<std::size_t>(length), '\0');
    EXPECT_EQ(outcome.bytes, expected);
  }
}

TEST_F(HostileInputTest, ShortBlocksOfNumbersAndFlags) {
  Run();
  for (const char* uri :
       {"0?SP_Baud?unsignedInt", "0?SP_Gap?unsignedInt", "0?SP_TokenQueueSize?unsignedInt",
        "0?rx_token_len?unsignedInt", "0?tokens_available?unsignedInt", "0?connect?boolean",
        "0?SP_Par?unsignedByte", "0?SP_HexTokens?boolean"}) {
    const ITag* tag = P().Tag(uri);
    for (int length = 0; length <= 9; ++length) {
      EXPECT_NE(P().ReadBlock(tag, length).result, 0) << uri << length;
    }
  }
}

TEST_F(HostileInputTest, AMegabyteOfConfiguration) {
  const std::string megabyte(1024 * 1024, 'x');
  EXPECT_FALSE(P().Config(megabyte));
  EXPECT_EQ(P().Error(), "-1 Parser: unknown format");
  EXPECT_TRUE(P().Config(Mandatory("unknown=" + megabyte)));
  EXPECT_TRUE(P().Config(megabyte + " " + Mandatory()));
  EXPECT_TRUE(P().Config(Mandatory(std::string(1024 * 1024, ' '))));
  EXPECT_FALSE(P().Config(Mandatory("rx_prefix=" + megabyte)));
  EXPECT_EQ(P().Error(), "-1 rx_prefix not in hex format");
  EXPECT_TRUE(P().Config(Mandatory("rx_prefix=" + std::string(1024 * 1024, 'A'))));
  EXPECT_FALSE(P().Config("CfgVer=1 model=" + megabyte));
  EXPECT_EQ(P().Error(), "-1 Parser: parameter 'port' is not found");
  EXPECT_FALSE(P().Config(Mandatory("token_queue_size=" + std::string(1024 * 1024, '9'))));
  EXPECT_EQ(P().Error(), "-1 parameter 'token_queue_size' out of range");
}

TEST_F(HostileInputTest, AMegabyteOfPortName) {
  const std::string name(1024 * 1024, 'p');
  ASSERT_TRUE(P().Config("CfgVer=1 model=1 port=" + name +
                         " baudrate=1 parity=none bits=8 stopbits=1 mode=RS-232"));
  ASSERT_NE(P()->Start(), 0);
  GuardedBuffer buffer(100);
  EXPECT_EQ(P()->vcsGetComParams(buffer.Chars(), 100), 1);
  EXPECT_EQ(buffer.Bytes(), name.substr(0, 100));
  EXPECT_TRUE(buffer.AreGuardsIntact());
}

TEST_F(HostileInputTest, AMegabyteOfNodes) {
  std::string many;
  for (int i = 0; many.size() < 1024 * 1024; ++i) many += "Node" + std::to_string(i % 2000) + "::";
  EXPECT_TRUE(P().Config(Mandatory(many)));
  std::string unfinished;
  while (unfinished.size() < 1024 * 1024) unfinished += "Node";
  EXPECT_TRUE(P().Config(Mandatory(unfinished)));
  EXPECT_TRUE(P().Config(Mandatory("Node" + std::string(100000, '9') + "::model=1")));
}

TEST_F(HostileInputTest, AMegabyteOfTagAddress) {
  ASSERT_TRUE(P().Config(Mandatory()));
  const std::string megabyte(1024 * 1024, 'x');
  EXPECT_EQ(P().Tag(megabyte), nullptr);
  EXPECT_EQ(P().Tag("0?" + megabyte + "?boolean"), nullptr);
  EXPECT_EQ(P().Tag("0?connect?" + megabyte), nullptr);
  EXPECT_EQ(P().Tag(std::string(1024 * 1024, '?')), nullptr);
  const ITag* tag = P().Tag("0?SP_Baud?unsignedInt(" + std::string(1024 * 1024, ',') + ")");
  ASSERT_NE(tag, nullptr);
  const unsigned char in[4] = {};
  unsigned char out[4] = {};
  EXPECT_FALSE(tag->Convert(in, out, true));
  EXPECT_NE(P().Tag(std::string(1024 * 1024, ' ') + "?connect?boolean"), nullptr);
}

TEST_F(HostileInputTest, AMegabyteOfIdent) {
  const std::string ident(1024 * 1024, 'i');
  P()->SetIdent(ident.c_str());
  EXPECT_EQ(ident, P()->GetIdent());
  host_.Log().SetRecording(false);
  ASSERT_TRUE(P().Config(Mandatory()));
  EXPECT_NE(P()->Start(), 0);
}

TEST_F(HostileInputTest, TwoProtocolsAtOnce) {
  Run("rx_suffix=03 tx_prefix=02");
  ProtocolUnderTest other(plugin_);
  other->SetIdent("other");
  ASSERT_TRUE(other.Config(
      "CfgVer=1 model=1 port=com2 baudrate=300 parity=none bits=7 stopbits=2 mode=RS-485 "
      "rx_suffix=04 hex_tokens=true"));
  ASSERT_NE(other->Start(), 0);
  ScriptedTask* otherTask = host_.MultiTask().LastTask();
  host_.Line("com2").Feed(
      "A\x03"
      "B\x04");
  otherTask->RunPasses(1);
  EXPECT_EQ(other.TakeTokens(), "[410342]");
  EXPECT_EQ(P().ReadNumber("tokens_available"), 0U);

  Calls();
  EXPECT_TRUE(P().WriteText("tx_token", "A"));
  EXPECT_TRUE(other.WriteText("tx_token", "42"));
  EXPECT_EQ(Calls(), "queue.Lock\nSend 02 41\nqueue.Unlock\nqueue2.Lock\nSend 42\nqueue2.Unlock\n");
  EXPECT_TRUE(P().WriteNumber("SP_Gap", 5));
  EXPECT_EQ(other.ReadNumber("SP_Gap"), 0U);
  EXPECT_FALSE(other.WriteText("tx_token", "4"));
  EXPECT_EQ(P().Error(), "1 ");
  P()->Stop();
  EXPECT_TRUE(other.ReadFlag("connect"));
  other->Stop();
}

// Semaphores that the host does not give: everything works without them.
class MissingSemaphoreTest : public PluginFixture,
                             public ::testing::WithParamInterface<std::vector<int>> {};

TEST_P(MissingSemaphoreTest, NothingBreaks) {
  for (const int nth : GetParam()) host_.Faults().FailNth("CreateSemaphore", nth);
  ProtocolUnderTest protocol(plugin_);
  ASSERT_NE(protocol.Get(), nullptr);
  ASSERT_TRUE(protocol.Config(Mandatory("rx_suffix=03")));
  protocol->Start();
  host_.Line().Feed(
      "A\x03"
      "B\x03");
  host_.RunPasses(3);
  for (const char* uri : {"0?rx_token?string-9", "0?tokens_available?unsignedInt",
                          "0?connect?boolean", "0?SP_Baud?unsignedInt", "0?SP_Done?boolean"}) {
    protocol.Read(protocol.Tag(uri));
  }
  for (const char* uri : {"0?tx_token?string-9", "0?token_ack?boolean", "0?connect?boolean",
                          "0?connect?boolean", "0?SP_Gap?unsignedInt", "0?SP_Done?boolean"}) {
    protocol.Write(protocol.Tag(uri), std::string(1, '\0'));
  }
  EXPECT_NE(protocol->Stop(), 0);
}

INSTANTIATE_TEST_SUITE_P(Which, MissingSemaphoreTest,
                         ::testing::Values(std::vector<int>{1}, std::vector<int>{2},
                                           std::vector<int>{1, 2}),
                         [](const auto& missing) {
                           std::string name;
                           if (missing.param.front() == 1) name += "Queue";
                           if (missing.param.back() == 2) name += "Port";
                           return name;
                         });

// One life of a protocol with every operation that calls the host, so that each of its calls can be
// made to fail once.
void LiveOnce(PluginUnderTest& plugin, ScriptedHost& host) {
  ProtocolUnderTest protocol(plugin);
  ASSERT_NE(protocol.Get(), nullptr);
  EXPECT_TRUE(protocol.Config(Mandatory("rx_suffix=03 tx_prefix=02")));
  if (protocol->Start() == 0) protocol->Start();
  host.Line().Feed("A\x03");
  host.RunPasses(2);
  const auto write = [&](const char* uri, const std::string& value) {
    protocol.Write(protocol.Tag(uri), value);
  };
  const auto read = [&](const char* uri) { protocol.Read(protocol.Tag(uri)); };
  write("0?tx_token?string-4", "A");
  write("0?SP_Par?unsignedByte", "\2");
  write("0?SP_RxPrefix?string-4", "05");
  write("0?SP_Done?boolean", "\1");
  for (const char* value : {"", "\1", "", "\1"})
    write("0?connect?boolean", value + std::string(1, '\0'));
  read("0?rx_token?string-9");
  read("0?connect?boolean");
  read("0?SP_RxPrefix?string-9");
  write("0?token_ack?boolean", "\1");
  EXPECT_NE(protocol->Stop(), 0);
}

TEST_F(PluginFixture, EveryHostCallMayFailOnce) {
  host_.Faults().Clear();
  host_.Storage().SetExtended(true);
  host_.Storage().PutString("LOKA", "rx_prefix", "04");
  LiveOnce(plugin_, host_);
  const int calls = host_.Faults().CallCount();
  ASSERT_GE(calls, 10);
  for (int nth = 1; nth <= calls; ++nth) {
    ScriptedHost host;
    PluginUnderTest plugin;
    plugin_.Close();
    ASSERT_EQ(plugin.Init(&host), 1);
    host.Faults().Clear();
    host.Storage().SetExtended(true);
    host.Storage().PutString("LOKA", "rx_prefix", "04");
    host.Faults().FailNthOfAll(nth);
    LiveOnce(plugin, host);
    plugin.Close();
    EXPECT_EQ(host.Complaints(), "") << "call " << nth << " failed\n" << host.Log().Text();
    ASSERT_EQ(plugin_.Init(&host_), 1);
  }
}

// The sanitizers reserve more address space than the limit leaves.
#ifndef LOKA_SANITIZED

// Leaves this process little more memory than it has.
void LimitMemory() {
  std::ifstream statm("/proc/self/statm");
  unsigned long pages = 0;
  statm >> pages;
  rlimit limit{};
  getrlimit(RLIMIT_AS, &limit);
  limit.rlim_cur = pages * 4096 + 64UL * 1024 * 1024;
  if (setrlimit(RLIMIT_AS, &limit) != 0) std::_Exit(99);
}

class MemoryShortageTest : public ProtocolFixture {
 protected:
  // In a process of its own: with little memory left, `call` must come back with 0.
  template <class Call>
  void ExpectFailure(Call call) {
    GTEST_FLAG_SET(death_test_style, "fast");
    EXPECT_EXIT(
        {
          LimitMemory();
          const int result = call();
          std::_Exit(result == 0 ? 0 : 1);
        },
        ::testing::ExitedWithCode(0), "");
  }
};

TEST_F(MemoryShortageTest, BlocksThatNoMemoryHolds) {
  Run();
  GuardedBuffer buffer(1);
  for (const char* uri :
       {"0?rx_token?string-9", "0?SP_Baud?unsignedInt", "0?tokens_available?unsignedInt",
        "0?connect?boolean", "0?SP_Bits?unsignedByte", "0?SP_RxPrefix?string-9"}) {
    const ITag* tag = P().Tag(uri);
    for (const int length : {INT_MAX, INT_MAX - 1, INT_MAX - 3, 0x20000000, 0x40000000}) {
      ExpectFailure([&] { return P()->ReadBlock(tag, buffer.Data(), length); });
    }
  }
}

TEST_F(MemoryShortageTest, TagsThatNoMemoryHolds) {
  Run();
  unsigned char byte = 0;
  const ITag* huge = P().Tag("0?rx_token?string-2147483647");
  const ITag* large = P().Tag("0?tx_token?string-999999999");
  ASSERT_NE(huge, nullptr);
  ExpectFailure([&] { return P()->Read(huge, &byte); });
  ExpectFailure([&] { return P()->readArrayItem(huge, 5, &byte); });
  ExpectFailure([&] { return P()->writeArrayItem(huge, 5, &byte); });
  ExpectFailure([&] { return P()->Write(large, &byte); });
  ExpectFailure([&] { return huge->Convert(&byte, &byte, true) ? 1 : 0; });
  ExpectFailure([&] { return huge->Convert(&byte, &byte, false) ? 1 : 0; });
}

// Texts that fit once but not twice.
TEST_F(MemoryShortageTest, TextsThatNoMemoryHolds) {
  const std::string text = Mandatory("x=" + std::string(48UL * 1024 * 1024, 'x'));
  const std::string uri(48UL * 1024 * 1024, '?');
  ExpectFailure([&] {
    LimitMemory();
    return P()->Config(text.c_str()) != 0 && P()->Config(text.c_str()) != 0 ? 0 : P()->Config("");
  });
  ExpectFailure([&] { return P()->CreateTag(uri.c_str()) == nullptr ? 0 : 1; });
  ExpectFailure([&] {
    P()->SetIdent(uri.c_str());
    P()->SetIdent(uri.c_str());
    return P()->GetIdent() != nullptr ? 0 : 1;
  });
}

#endif

}  // namespace
