// SPDX-License-Identifier: Apache-2.0
// Block reads of each memory type: values, lengths, chunks, errors and the semaphore taken.
#include <climits>

#include "tests/plugin/PluginFixture.h"

namespace {

using std::string_literals::operator""s;

constexpr const char* kQueuePair = "queue.Lock\nqueue.Unlock\n";

std::string Times(int count, const std::string& text) {
  std::string all;
  for (int i = 0; i < count; ++i) all += text;
  return all;
}

class ReadTest : public ProtocolFixture {
 protected:
  const ITag* Tag(const std::string& memoryTypeAndType) {
    const ITag* tag = P().Tag("0?" + memoryTypeAndType);
    EXPECT_NE(tag, nullptr) << memoryTypeAndType << ": " << P().Error();
    return tag;
  }
  // A successful block read's bytes.
  std::string Block(const std::string& memoryTypeAndType, int lengthBytes) {
    const ReadOutcome outcome = P().ReadBlock(Tag(memoryTypeAndType), lengthBytes);
    EXPECT_NE(outcome.result, 0) << memoryTypeAndType << ": " << P().Error();
    return outcome.bytes;
  }
};

TEST_F(ReadTest, NotBeforeStart) {
  ASSERT_TRUE(P().Config(Mandatory()));
  for (const char* type :
       {"tx_token?string-4", "rx_token?string-4", "rx_token_len?unsignedInt",
        "tokens_available?unsignedInt", "token_ack?boolean", "connect?boolean",
        "SP_Baud?unsignedInt", "SP_Bits?unsignedByte", "SP_RxPrefix?string-4", "SP_Done?boolean"}) {
    const ITag* tag = Tag(type);
    P()->WriteBlock(tag, nullptr, 0);  // some other error in front
    EXPECT_EQ(P()->createAlarm("x"), nullptr);
    const ReadOutcome outcome = P().ReadBlock(tag, tag->PackedLen());
    EXPECT_EQ(outcome.result, 0) << type;
    EXPECT_TRUE(outcome.untouched) << type;
    EXPECT_EQ(P().Error(), "-3 Protocol not started") << type;
  }
  EXPECT_EQ(Calls(), "");
}

TEST_F(ReadTest, AnEmptyQueue) {
  Run();
  EXPECT_EQ(Block("rx_token?string-4", 4), "\0\0\0\0"s);
  EXPECT_EQ(Block("rx_token_len?unsignedInt", 4), "\0\0\0\0"s);
  EXPECT_EQ(Block("tokens_available?unsignedInt", 4), "\0\0\0\0"s);
  EXPECT_EQ(Calls(), Times(3, kQueuePair));
}

TEST_F(ReadTest, TheOldestTokenStaysUntilAcknowledged) {
  Run("rx_suffix=03");
  Receive(
      "HELLO\x03"
      "YOU\x03");
  Calls();
  for (int i = 0; i < 2; ++i) {
    EXPECT_EQ(Block("rx_token?string-8", 8), "HELLO\0\0\0"s);
    EXPECT_EQ(Block("rx_token_len?unsignedInt", 4), "\5\0\0\0"s);
    EXPECT_EQ(Block("tokens_available?unsignedInt", 4), "\2\0\0\0"s);
  }
  EXPECT_EQ(Calls(), Times(6, kQueuePair));
  EXPECT_TRUE(P().WriteFlag("token_ack", 0)) << "the value does not matter";
  EXPECT_EQ(Block("rx_token?string-8", 8), "YOU\0\0\0\0\0"s);
  EXPECT_EQ(Block("rx_token_len?unsignedInt", 4), "\3\0\0\0"s);
  EXPECT_EQ(Block("tokens_available?unsignedInt", 4), "\1\0\0\0"s);
}

TEST_F(ReadTest, TheTerminatingZeroMustFit) {
  Run("rx_suffix=03");
  Receive("HELLO\x03");
  Calls();
  EXPECT_EQ(Block("rx_token?string-6", 6), "HELLO\0"s);
  EXPECT_EQ(Calls(), kQueuePair);
  for (const char* type : {"rx_token?string-5", "rx_token?string-4", "rx_token?string-1"}) {
    const ITag* tag = Tag(type);
    const ReadOutcome outcome = P().ReadBlock(tag, tag->PackedLen());
    EXPECT_EQ(outcome.result, 0) << type;
    EXPECT_TRUE(outcome.untouched) << type;
    EXPECT_EQ(P().Error(), "-1 token too long") << type;
    EXPECT_EQ(Calls(), kQueuePair) << "the semaphore is given back on failure too";
  }
  EXPECT_EQ(P().ReadNumber("tokens_available"), 1U);
}

TEST_F(ReadTest, TheTagsLengthCountsNotTheCallers) {
  Run("rx_suffix=03");
  Receive("HELLO\x03");
  const ITag* tag = Tag("rx_token?string-5");
  EXPECT_EQ(P().ReadBlock(tag, 100).result, 0);
  EXPECT_EQ(P().Error(), "-1 token too long");
  EXPECT_EQ(Block("rx_token?string-256", 3), "HEL");
  EXPECT_EQ(Block("rx_token?string-256", 5), "HELLO");
  EXPECT_EQ(Block("rx_token?string-256", 6), "HELLO\0"s);
  EXPECT_EQ(Block("rx_token?string-6", 9), "HELLO\0\0\0\0"s);
}

TEST_F(ReadTest, AZeroByteEndsTheTextButCountsInTheLength) {
  Run("rx_suffix=03");
  Receive("AB\0CD\x03"s);
  EXPECT_EQ(Block("rx_token?string-8", 8), "AB\0\0\0\0\0\0"s);
  EXPECT_EQ(Block("rx_token_len?unsignedInt", 4), "\5\0\0\0"s);
  const ITag* tag = Tag("rx_token?string-5");
  EXPECT_EQ(P().ReadBlock(tag, 5).result, 0) << "the full length must be shorter than the tag";
}

TEST_F(ReadTest, ATokenThatStartsWithZeroOrIsEmpty) {
  Run("rx_suffix=03");
  Receive("\0A\x03\x03"s);
  EXPECT_EQ(Block("rx_token?string-4", 4), "\0\0\0\0"s);
  EXPECT_EQ(Block("rx_token_len?unsignedInt", 4), "\2\0\0\0"s);
  EXPECT_TRUE(P().WriteFlag("token_ack", 1));
  EXPECT_EQ(Block("tokens_available?unsignedInt", 4), "\1\0\0\0"s);
  EXPECT_EQ(Block("rx_token?string-1", 1), "\0"s);
  EXPECT_EQ(Block("rx_token_len?unsignedInt", 4), "\0\0\0\0"s);
}

TEST_F(ReadTest, TheLengthOfALongToken) {
  Run("rx_suffix=03 hex_tokens=true");
  Receive(std::string(1000, 'A') + "\x03");
  EXPECT_EQ(P().ReadNumber("rx_token_len"), 2000U);
  EXPECT_EQ(P().ReadText("rx_token", 2001).size(), 2000U);
}

TEST_F(ReadTest, WriteOnlyTypesReadAsZero) {
  Run();
  EXPECT_EQ(Block("tx_token?string-4", 4), "\0\0\0\0"s);
  EXPECT_EQ(Calls(), kQueuePair);
  EXPECT_EQ(Block("token_ack?boolean", 1), "\0"s);
  EXPECT_EQ(Calls(), Times(8, kQueuePair)) << "one for each bit of the byte";
}

TEST_F(ReadTest, TheConnectionFlag) {
  Run();
  EXPECT_EQ(Block("connect?boolean", 1), "\1"s);
  EXPECT_EQ(Calls(), Times(8, kQueuePair));
  EXPECT_TRUE(P().WriteFlag("connect", 0));
  Calls();
  EXPECT_EQ(Block("connect?boolean", 1), "\0"s);
  EXPECT_EQ(Calls(), Times(8, kQueuePair));
  EXPECT_EQ(P().ReadFlag("connect"), false);
  EXPECT_EQ(Calls(), Times(8, kQueuePair)) << "a tag read asks for one byte as well";
}

// A byte of a boolean type is read bit by bit, and each bit delivers the whole value.
TEST_F(ReadTest, BooleansOfSeveralBytes) {
  Run("hex_tokens=true");
  EXPECT_EQ(Block("connect?boolean", 3), "\1\1\1"s);
  EXPECT_EQ(Calls(), Times(24, kQueuePair));
  EXPECT_EQ(Block("SP_HexTokens?boolean", 2), "\1\1"s);
  EXPECT_EQ(Block("SP_Done?boolean", 2), "\0\0"s);
  EXPECT_EQ(Calls(), "");
}

TEST_F(ReadTest, ItemsOfABlockWithoutACountAreReadOneByOne) {
  Run();
  ASSERT_TRUE(P().WriteByte("SP_Bits", 8));
  EXPECT_EQ(Block("SP_Bits?unsignedByte", 4), "\x08\x08\x08\x08");
  EXPECT_EQ(Block("SP_Baud?unsignedInt", 8), "\x80\x25\0\0\x80\x25\0\0"s);
  EXPECT_EQ(Calls(), "");
  EXPECT_EQ(Block("tokens_available?unsignedInt", 12), std::string(12, '\0'));
  EXPECT_EQ(Calls(), Times(3, kQueuePair));
}

TEST_F(ReadTest, ItemsOfABlockWithACountAreReadAtOnce) {
  Run("rx_suffix=03");
  Receive("HELLO\x03");
  Calls();
  EXPECT_EQ(Block("rx_token_len?unsignedInt", 12), "\5\0\0\0\0\0\0\0\0\0\0\0"s);
  EXPECT_EQ(Calls(), kQueuePair);
}

TEST_F(ReadTest, LengthsThatAreNoWholeItems) {
  Run();
  EXPECT_EQ(Block("SP_Baud?unsignedInt", 1), "\x80");
  EXPECT_EQ(Block("SP_Baud?unsignedInt", 3), "\x80\x25\0"s);
  EXPECT_EQ(Block("SP_Baud?unsignedInt", 6), "\x80\x25\0\0\x80\x25"s);
  EXPECT_EQ(Calls(), "");
  EXPECT_EQ(Block("tokens_available?unsignedInt", 5), std::string(5, '\0'));
  EXPECT_EQ(Calls(), Times(2, kQueuePair));
}

TEST_F(ReadTest, NoBytesAtAll) {
  Run("rx_suffix=03");
  Receive("HELLO\x03");
  Calls();
  for (const char* type : {"rx_token?string-2", "tokens_available?unsignedInt", "connect?boolean",
                           "SP_Baud?unsignedInt"}) {
    EXPECT_EQ(Block(type, 0), "") << type;
  }
  EXPECT_EQ(Calls(), "") << "no item, no read";
}

TEST_F(ReadTest, NegativeLengthOrNoBuffer) {
  Run("rx_suffix=03");
  Receive("HELLO\x03");
  Calls();
  for (const char* type : {"rx_token?string-20", "tokens_available?unsignedInt", "connect?boolean",
                           "SP_Baud?unsignedInt", "SP_RxPrefix?string-5"}) {
    const ITag* tag = Tag(type);
    for (const int length : {-1, -8, INT_MIN}) {
      EXPECT_EQ(P()->createAlarm("x"), nullptr);
      P()->WriteBlock(tag, nullptr, 0);
      const ReadOutcome outcome = P().ReadBlock(tag, length);
      EXPECT_EQ(outcome.result, 0) << type << " " << length;
      EXPECT_EQ(P()->GetLastError(), -1) << type << " " << length;
    }
    P()->WriteBlock(tag, nullptr, 0);
    EXPECT_EQ(P()->ReadBlock(tag, nullptr, 4), 0) << type;
    EXPECT_EQ(P()->GetLastError(), -1) << type;
  }
}

TEST_F(ReadTest, SerialSettingsTakeNoSemaphore) {
  Run("rx_prefix=02 rx_suffix=0D0A tx_prefix=none tx_suffix=ff gap=70 token_queue_size=258");
  EXPECT_EQ(Block("SP_Baud?unsignedInt", 4), "\x80\x25\0\0"s);
  EXPECT_EQ(Block("SP_Par?unsignedByte", 1), "\1"s);
  EXPECT_EQ(Block("SP_Bits?unsignedByte", 1), "\x08"s);
  EXPECT_EQ(Block("SP_Stop?unsignedByte", 1), "\1"s);
  EXPECT_EQ(Block("SP_Mode?unsignedByte", 1), "\0"s);
  EXPECT_EQ(Block("SP_RxPrefix?string-8", 8), "02\0\0\0\0\0\0"s);
  EXPECT_EQ(Block("SP_RxSuffix?string-8", 8), "0D0A\0\0\0\0"s);
  EXPECT_EQ(Block("SP_TxPrefix?string-8", 8), "none\0\0\0\0"s);
  EXPECT_EQ(Block("SP_TxSuffix?string-8", 8), "ff\0\0\0\0\0\0"s);
  EXPECT_EQ(Block("SP_Gap?unsignedInt", 4), "\x46\0\0\0"s);
  EXPECT_EQ(Block("SP_HexTokens?boolean", 1), "\0"s);
  EXPECT_EQ(Block("SP_TokenQueueSize?unsignedInt", 4), "\2\1\0\0"s);
  EXPECT_EQ(Block("SP_Done?boolean", 1), "\0"s);
  EXPECT_EQ(Calls(), "");
}

TEST_F(ReadTest, OneByteTypesDeliverTheLowByte) {
  host_.Storage().Put("LOKA", "parity", 0x1234);
  host_.Storage().Put("LOKA", "bits", 0x107);
  host_.Storage().Put("LOKA", "stop", -1);
  host_.Storage().Put("LOKA", "mode", 256);
  Run("autoConnect=false");
  EXPECT_EQ(P().ReadByte("SP_Par"), 0x34U);
  EXPECT_EQ(P().ReadByte("SP_Bits"), 0x07U);
  EXPECT_EQ(P().ReadByte("SP_Stop"), 0xFFU);
  EXPECT_EQ(P().ReadByte("SP_Mode"), 0U);
}

TEST_F(ReadTest, FramingTextsMustFitWithTheirZero) {
  Run("rx_prefix=0102 rx_suffix=0304 tx_prefix=0506 tx_suffix=0708");
  const struct {
    const char* type;
    const char* text;
    const char* error;
  } rows[] = {{"SP_RxPrefix", "0102", "-1 rx prefix too long to read"},
              {"SP_RxSuffix", "0304", "-1 rx suffix too long to read"},
              {"SP_TxPrefix", "0506", "-1 tx prefix too long to read"},
              {"SP_TxSuffix", "0708", "-1 tx suffix too long to read"}};
  for (const auto& row : rows) {
    EXPECT_EQ(P().ReadText(row.type, 5), row.text);
    for (const int declared : {4, 3, 1}) {
      const ITag* tag = Tag(std::string(row.type) + "?string-" + std::to_string(declared));
      const ReadOutcome outcome = P().ReadBlock(tag, declared);
      EXPECT_EQ(outcome.result, 0) << row.type << declared;
      EXPECT_TRUE(outcome.untouched);
      EXPECT_EQ(P().Error(), row.error);
    }
    EXPECT_EQ(Block(std::string(row.type) + "?string-5", 2), std::string(row.text).substr(0, 2));
  }
}

TEST_F(ReadTest, AnEmptyFramingTextNeedsOneByte) {
  Run();
  EXPECT_EQ(Block("SP_RxPrefix?string-1", 1), "\0"s);
  const ITag* tag = Tag("SP_RxPrefix?string-0");
  EXPECT_NE(P().ReadBlock(tag, 0).result, 0) << "no item, nothing to go wrong";
  EXPECT_EQ(P().ReadBlock(tag, 4).result, 0);
  EXPECT_EQ(P().Error(), "-1 rx prefix too long to read");
}

// A string longer than the memory type's block count is read in chunks, and each chunk starts with
// the whole value, or with as much of it as fits.
TEST_F(ReadTest, LongStringsAreReadInChunks) {
  Run("rx_prefix=0D0A");
  const std::string bytes = Block("SP_RxPrefix?string-20000", 20000);
  std::string expected(20000, '\0');
  expected.replace(0, 4, "0D0A");
  expected.replace(9999, 4, "0D0A");
  expected.replace(19998, 2, "0D");
  EXPECT_EQ(bytes, expected);
}

TEST_F(ReadTest, AValueLongerThanItsChunk) {
  std::string prefix;
  while (prefix.size() < 20000) prefix += "0123456789abcdef";
  prefix.resize(20000);
  Run("rx_prefix=" + prefix);
  const std::string bytes = Block("SP_RxPrefix?string-30000", 30000);
  EXPECT_EQ(bytes, prefix.substr(0, 9999) + prefix.substr(0, 9999) + prefix.substr(0, 9999) +
                       prefix.substr(0, 3));
  EXPECT_EQ(Block("SP_RxPrefix?string-30000", 10), prefix.substr(0, 10));
}

TEST_F(ReadTest, TokensOfAnyTagLength) {
  Run("rx_suffix=03");
  Receive("HELLO\x03");
  for (const int declared : {6, 127, 128, 129, 255, 256, 257, 20000, 1000000}) {
    const std::string bytes = Block("rx_token?string-" + std::to_string(declared), declared);
    std::string expected(static_cast<std::size_t>(declared), '\0');
    expected.replace(0, 5, "HELLO");
    EXPECT_EQ(bytes, expected) << declared;
  }
}

TEST_F(ReadTest, TheResultOfASuccessIsOne) {
  Run();
  EXPECT_EQ(P().ReadBlock(Tag("SP_Baud?unsignedInt"), 4).result, 1);
}

}  // namespace
