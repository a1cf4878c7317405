// SPDX-License-Identifier: Apache-2.0
// Tag reads in all their forms: plain, with a time stamp, single items of a string.
#include <chrono>
#include <climits>

#include "tests/plugin/PluginFixture.h"

namespace {

using std::string_literals::operator""s;

unsigned long long NowMs() {
  return static_cast<unsigned long long>(std::chrono::duration_cast<std::chrono::milliseconds>(
                                             std::chrono::system_clock::now().time_since_epoch())
                                             .count());
}

class ReadDispatchTest : public ProtocolFixture {};

TEST_F(ReadDispatchTest, ReadConvertsTheBlockRead) {
  Run("rx_suffix=03");
  Receive("HELLO\x03");
  EXPECT_EQ(P().Read(P().Tag("0?rx_token?string-8")).bytes, "HELLO\0\0\0"s);
  EXPECT_EQ(P().Read(P().Tag("0?rx_token?string-8(swap2)")).bytes, "EHLL\0O\0\0"s);
  EXPECT_EQ(P().Read(P().Tag("0?tokens_available?unsignedInt")).bytes, "\1\0\0\0"s);
  EXPECT_EQ(P().Read(P().Tag("0?connect?boolean")).bytes, "\1"s);
}

TEST_F(ReadDispatchTest, WorkBuffersOfEverySize) {
  Run("rx_suffix=03");
  Receive("HELLO\x03");
  for (const int declared : {6, 63, 64, 65, 128, 129, 1000, 70000}) {
    const ReadOutcome outcome = P().Read(P().Tag("0?rx_token?string-" + std::to_string(declared)));
    EXPECT_NE(outcome.result, 0);
    std::string expected(static_cast<std::size_t>(declared), '\0');
    expected.replace(0, 5, "HELLO");
    EXPECT_EQ(outcome.bytes, expected) << declared;
  }
}

TEST_F(ReadDispatchTest, AStringWithoutLengthReadsNothing) {
  Run();
  const ReadOutcome outcome = P().Read(P().Tag("0?rx_token?string-"));
  EXPECT_NE(outcome.result, 0);
  EXPECT_TRUE(outcome.untouched);
  EXPECT_EQ(Calls(), "");
}

TEST_F(ReadDispatchTest, AFailedReadKeepsTheDriversError) {
  Run("rx_suffix=03");
  Receive("HELLO\x03");
  const ReadOutcome outcome = P().Read(P().Tag("0?rx_token?string-5(nosuch)"));
  EXPECT_EQ(outcome.result, 0);
  EXPECT_TRUE(outcome.untouched);
  EXPECT_EQ(P().Error(), "-1 token too long");
}

TEST_F(ReadDispatchTest, TimeStamps) {
  Run("rx_suffix=03");
  Receive("HELLO\x03");
  const ITag* tag = P().Tag("0?rx_token?string-8");
  unsigned char value[8] = {};
  unsigned long long stamp = 0;
  const unsigned long long before = NowMs();
  EXPECT_NE(P()->readWithTimestamp(tag, value, &stamp), 0);
  EXPECT_GE(stamp, before);
  EXPECT_LE(stamp, NowMs());
  EXPECT_EQ(std::string(value, value + 8), "HELLO\0\0\0"s);

  stamp = 0;
  EXPECT_EQ(P()->readBlockWithTimestamp(tag, value, 3, &stamp), 1);
  EXPECT_GE(stamp, before);
  EXPECT_LE(stamp, NowMs());
}

TEST_F(ReadDispatchTest, AFailedReadLeavesTheTimeStamp) {
  Run("rx_suffix=03");
  Receive("HELLO\x03");
  const ITag* tooShort = P().Tag("0?rx_token?string-5");
  const ITag* noConversion = P().Tag("0?SP_Baud?unsignedInt(nosuch)");
  unsigned char value[8] = {};
  unsigned long long stamp = 42;
  EXPECT_EQ(P()->readWithTimestamp(tooShort, value, &stamp), 0);
  EXPECT_EQ(P()->readBlockWithTimestamp(tooShort, value, 5, &stamp), 0);
  EXPECT_EQ(P()->readWithTimestamp(noConversion, value, &stamp), 0);
  EXPECT_EQ(P().Error(), "-9 read conversion error");
  EXPECT_EQ(P()->readBitBlockWithTimestamp(tooShort, value, 8, &stamp), 0);
  P()->Stop();
  EXPECT_EQ(P()->readWithTimestamp(tooShort, value, &stamp), 0);
  EXPECT_EQ(P().Error(), "-3 Protocol not started");
  EXPECT_EQ(stamp, 42U);
}

TEST_F(ReadDispatchTest, ItemsOfAString) {
  Run("rx_suffix=03");
  Receive("HELLO\x03");
  Calls();
  const ITag* tag = P().Tag("0?rx_token?string-8");
  const std::string expected = "HELLO\0\0\0"s;
  for (int i = 0; i < 8; ++i) {
    GuardedBuffer item(1);
    EXPECT_NE(P()->readArrayItem(tag, i, item.Data()), 0) << i;
    EXPECT_TRUE(item.AreGuardsIntact());
    EXPECT_EQ(item.Bytes()[0], expected[static_cast<std::size_t>(i)]) << i;
    EXPECT_EQ(Calls(), "queue.Lock\nqueue.Unlock\n") << "the whole value is read once";
  }
}

TEST_F(ReadDispatchTest, ItemsOutOfRange) {
  Run();
  const ITag* tag = P().Tag("0?rx_token?string-8");
  const ITag* empty = P().Tag("0?rx_token?string-0");
  Calls();
  for (const int index : {-1, 8, 9, INT_MIN, INT_MAX}) {
    GuardedBuffer item(4);
    P()->WriteBlock(nullptr, nullptr, 0);
    EXPECT_EQ(P()->readArrayItem(tag, index, item.Data()), 0) << index;
    EXPECT_EQ(P().Error(), "-1 accessing array item out of range") << index;
    EXPECT_TRUE(item.IsUntouched());
    P()->WriteBlock(nullptr, nullptr, 0);
    EXPECT_EQ(P()->writeArrayItem(tag, index, item.Data()), 0) << index;
    EXPECT_EQ(P().Error(), "-1 accessing array item out of range") << index;
  }
  unsigned char item = 0;
  EXPECT_EQ(P()->readArrayItem(empty, 0, &item), 0);
  EXPECT_EQ(P().Error(), "-1 accessing array item out of range");
  EXPECT_EQ(Calls(), "");
}

TEST_F(ReadDispatchTest, ScalarsHaveNoItems) {
  Run();
  unsigned char item[4] = {};
  for (const char* uri : {"0?SP_Baud?unsignedInt", "0?connect?boolean", "0?SP_Par?unsignedByte"}) {
    const ITag* tag = P().Tag(uri);
    for (const int index : {0, -1, 5}) {
      P()->WriteBlock(nullptr, nullptr, 0);
      EXPECT_EQ(P()->readArrayItem(tag, index, item), 0) << uri;
      EXPECT_EQ(P().Error(), "-1 accessing an array item where the tag is not array") << uri;
      P()->WriteBlock(nullptr, nullptr, 0);
      EXPECT_EQ(P()->writeArrayItem(tag, index, item), 0) << uri;
      EXPECT_EQ(P().Error(), "-1 accessing an array item where the tag is not array") << uri;
    }
  }
  EXPECT_EQ(Calls(), "");
}

TEST_F(ReadDispatchTest, AFailedReadGivesNoItem) {
  Run("rx_suffix=03");
  Receive("HELLO\x03");
  GuardedBuffer item(4);
  EXPECT_EQ(P()->readArrayItem(P().Tag("0?rx_token?string-5"), 0, item.Data()), 0);
  EXPECT_EQ(P().Error(), "-1 token too long");
  EXPECT_TRUE(item.IsUntouched());
}

TEST_F(ReadDispatchTest, WritingAnItemWritesTheWholeValue) {
  Run("tx_prefix=0203");
  const ITag* prefix = P().Tag("0?SP_TxPrefix?string-8");
  const unsigned char digit = '4';
  EXPECT_NE(P()->writeArrayItem(prefix, 1, &digit), 0);
  EXPECT_EQ(P().ReadText("SP_TxPrefix"), "0403");
  EXPECT_EQ(Calls(), "");

  const ITag* token = P().Tag("0?tx_token?string-4");
  const unsigned char letter = 'A';
  EXPECT_NE(P()->writeArrayItem(token, 0, &letter), 0);
  EXPECT_EQ(Calls(), "queue.Lock\nqueue.Unlock\nqueue.Lock\nSend 02 03 41\nqueue.Unlock\n");
  // The other items of a token to send read as zero, so a later item sends an empty text.
  EXPECT_NE(P()->writeArrayItem(token, 1, &letter), 0);
  EXPECT_EQ(Calls(), "queue.Lock\nqueue.Unlock\nqueue.Lock\nSend 02 03\nqueue.Unlock\n");
}

TEST_F(ReadDispatchTest, WritingAnItemFailsAsTheWriteDoes) {
  Run("rx_suffix=03");
  Receive("HELLO\x03");
  const unsigned char letter = 'J';
  EXPECT_EQ(P()->writeArrayItem(P().Tag("0?rx_token?string-8"), 0, &letter), 0);
  EXPECT_EQ(P().Error(), "-1 writing to read_only type");
  EXPECT_EQ(P()->writeArrayItem(P().Tag("0?SP_RxSuffix?string-8"), 0, &letter), 0);
  EXPECT_EQ(P().Error(), "-1 Rx suffix value is not hex format");
  EXPECT_EQ(P().ReadText("SP_RxSuffix"), "03");
}

TEST_F(ReadDispatchTest, AnItemIsNotWrittenWhenTheReadFails) {
  Run("tx_prefix=0203");
  const unsigned char letter = '4';
  Calls();
  EXPECT_EQ(P()->writeArrayItem(P().Tag("0?SP_TxPrefix?string-4"), 0, &letter), 0);
  EXPECT_EQ(P().Error(), "-1 tx prefix too long to read");
  EXPECT_EQ(P().ReadText("SP_TxPrefix"), "0203");
}

TEST_F(ReadDispatchTest, ItemsOfLongStrings) {
  Run("rx_suffix=03");
  Receive("HELLO\x03");
  for (const int declared : {255, 256, 257, 50000}) {
    const ITag* tag = P().Tag("0?rx_token?string-" + std::to_string(declared));
    GuardedBuffer item(1);
    EXPECT_NE(P()->readArrayItem(tag, 4, item.Data()), 0);
    EXPECT_EQ(item.Bytes(), "O");
    EXPECT_NE(P()->readArrayItem(tag, declared - 1, item.Data()), 0);
    EXPECT_EQ(item.Bytes(), "\0"s);
    EXPECT_TRUE(item.AreGuardsIntact());
    EXPECT_EQ(P()->readArrayItem(tag, declared, item.Data()), 0);
  }
}

}  // namespace
