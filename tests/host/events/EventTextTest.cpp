// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <nlohmann/json.hpp>

#include "host/events/EventStream.h"
#include "host/events/EventText.h"
#include "host/events/HexDump.h"
#include "host/events/Statistics.h"
#include "host/events/TokenFormat.h"
#include "host/text/TextStyle.h"

namespace {

HostEvent EventNow(HostEvent::Detail detail) { return {0, "com1", std::move(detail)}; }

std::string Text(HostEvent::Detail detail) { return EventText(EventNow(std::move(detail))); }

TEST(EventTextTest, SaysEachKind) {
  EXPECT_EQ(Text(BytesReceived{"\x02"
                               "A"}),
            "rx 02 41  \"\\x02A\"");
  EXPECT_EQ(Text(BytesSent{"AB", 2}), "tx 41 42  \"AB\"");
  EXPECT_EQ(Text(BytesSent{"AB", 0}), "tx 41 42  \"AB\"  lost: the line took 0 of 2 bytes");
  EXPECT_EQ(Text(BytesLabelled{"body", "AB"}), "41 42 body");
  EXPECT_EQ(Text(BytesDropped{"no-suffix", "ST,", 500}),
            "drop no-suffix after 500 ms: 53 54 2C  \"ST,\"");
  EXPECT_EQ(Text(SettingChanged{"staged", "baud", "19200", "9600"}),
            "staged: baud 19200 (active 9600)");
  EXPECT_EQ(Text(SettingChanged{"applied", "baud", "19200", "9600"}),
            "applied: baud 19200 (was 9600)");
  EXPECT_EQ(Text(SettingChanged{"stored", "baud", "19200", ""}), "stored: baud 19200");
  EXPECT_EQ(Text(ConsoleReplied{"get_stat", true, "Connected"}), "console \"get_stat\": Connected");
  EXPECT_EQ(Text(PortChanged{"closed", "", ""}), "port closed");
  EXPECT_EQ(Text(FindingMade{"other token", "A", "B"}),
            "finding: other token; driver \"A\", expected \"B\"");
}

TEST(EventTextTest, NeverHoldsABareControlByte) {
  for (int value = 0; value < 256; ++value) {
    const std::string byte(1, static_cast<char>(static_cast<unsigned char>(value)));
    for (const std::string& text :
         {Text(BytesReceived{byte}), Text(BytesDropped{"no-suffix", byte, 1}), Text(NoteMade{byte}),
          Text(ConsoleReplied{byte, false, byte}), Text(PortChanged{"lost", "EIO", byte}),
          Text(TokenReceived{1, byte, 1, 1, -1, false, ""}), HexDump(byte)}) {
      for (const char character : text) {
        ASSERT_TRUE(character >= 0x20 && character < 0x7F) << value << ": " << text;
      }
    }
  }
}

TEST(HexDumpTest, PrefixAndSuffixAreDim) {
  const std::string frame =
      "\x02"
      "AB\r\n";
  EXPECT_EQ(HexDump(frame, 1, 2, TextStyle("never")), "02 41 42 0D 0A   .AB..");
  EXPECT_EQ(HexDump(frame, 1, 2, TextStyle("always")),
            "\x1b[2m02\x1b[0m 41 42 \x1b[2m0D 0A\x1b[0m   \x1b[2m.\x1b[0mAB\x1b[2m..\x1b[0m");
  EXPECT_EQ(HexDump("A", 0, 0, TextStyle("always")), "41   A");
  // More than there is: nothing is read behind the end.
  EXPECT_EQ(HexDump("A", 5, 5, TextStyle("never")), "41   A");
  EXPECT_EQ(HexDump("", 0, 0, TextStyle("never")), "   ");
}

TEST(TokenFormatTest, PutsTheTokenIn) {
  TokenFormat format;
  std::string error;
  ASSERT_TRUE(TokenFormat::Parse("%n %l [%p] %x %a %P %%\\t.", &format, &error));
  EXPECT_EQ(format.Write(EventNow(TokenReceived{7, "A\x1B", 2, 3, -1, false, ""})),
            "7 2 [A\\x1b] 41 1B 3 com1 %\t.");
  ASSERT_TRUE(TokenFormat::Parse("%j", &format, &error));
  EXPECT_EQ(format.Write(EventNow(TokenReceived{7, "A", 1, 3, -1, false, ""})),
            R"({"t":"1970-01-01T00:00:00.000000Z","ev":"token","port":"com1","n":7,"len":1,)"
            R"("text":"A","hex":"41","waiting":3})");
}

TEST(TokenFormatTest, RefusesWhatItDoesNotKnow) {
  TokenFormat format;
  for (const char* const text : {"%", "%z", "a%", "%%%"}) {
    std::string error;
    EXPECT_FALSE(TokenFormat::Parse(text, &format, &error)) << text;
    EXPECT_NE(error.find("%p payload"), std::string::npos) << error;
  }
}

TEST(StatisticsTest, CountsWhatHappened) {
  EventStream stream("com1");
  Statistics statistics;
  stream.Add(&statistics);
  stream.Publish(BytesReceived{"ABCDE"});
  stream.Publish(TokenReceived{1, "A", 3, 1, -1, true, ""});
  stream.Publish(BytesDropped{"no-suffix", "BC", 500});
  stream.Publish(BytesDropped{"no-suffix", "B", 500});
  stream.Publish(BytesDropped{"over-1000", "B", 0});
  stream.Publish(BytesSent{"AB", 2});
  stream.Publish(BytesSent{"AB", 1});
  stream.Publish(PortChanged{"lost", "EIO", ""});
  stream.Publish(PortChanged{"back", "", ""});
  stream.Publish(FindingMade{});
  stream.Publish(NoteMade{"some came too fast", 7});
  stream.Remove(&statistics);
  stream.Publish(BytesReceived{"not counted any more"});
  const nlohmann::json counts = statistics.ToJson();
  EXPECT_EQ(counts["received_bytes"], 5);
  EXPECT_EQ(counts["missed_bytes"], 7);
  EXPECT_EQ(counts["tokens"], 1);
  EXPECT_EQ(counts["token_bytes"], 3);
  EXPECT_EQ(counts["drops"], nlohmann::json({{"no-suffix", 2}, {"over-1000", 1}}));
  EXPECT_EQ(counts["dropped_bytes"], 4);
  EXPECT_EQ(counts["sends"], 2);
  EXPECT_EQ(counts["sent_bytes"], 3);
  EXPECT_EQ(counts["lost_sends"], 1);
  EXPECT_EQ(counts["losses"], 1);
  EXPECT_EQ(counts["reconnects"], 1);
  EXPECT_EQ(counts["findings"], 1);
}

}  // namespace
