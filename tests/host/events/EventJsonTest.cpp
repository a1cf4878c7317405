// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <algorithm>
#include <nlohmann/json.hpp>

#include "host/events/EventJson.h"

namespace {

// 2026-11-21 09:12:03.123456 UTC.
constexpr std::int64_t kTimeUs = 1795252323123456;

HostEvent EventAtTime(HostEvent::Detail detail) { return {kTimeUs, "com1", std::move(detail)}; }

struct Case {
  const char* name;
  HostEvent event;
  const char* line;
};

std::vector<Case> Cases() {
  return {
      {"Received",
       EventAtTime(BytesReceived{"\x02"
                                 "A\x03"}),
       R"("ev":"rx","port":"com1","hex":"024103"})"},
      {"Sent", EventAtTime(BytesSent{"AB", 1}),
       R"("ev":"tx","port":"com1","hex":"4142","sent":1})"},
      {"Label", EventAtTime(BytesLabelled{"suffix", "\x03"}),
       R"("ev":"label","port":"com1","role":"suffix","hex":"03"})"},
      {"Token", EventAtTime(TokenReceived{17, "ST,GS+5.1", 9, 1, 9375, false, ""}),
       R"("ev":"token","port":"com1","n":17,"len":9,"text":"ST,GS+5.1","hex":"53542C47532B352E31","waiting":1,"dur_us":9375})"},
      {"CutToken",
       EventAtTime(TokenReceived{1, "A", 3, 2, -1, true,
                                 "\x02"
                                 "A",
                                 1, 0}),
       R"("ev":"token","port":"com1","n":1,"len":3,"text":"A","hex":"41","waiting":2,"cut":true,"frame":"0241","prefix_len":1,"suffix_len":0})"},
      {"Drop", EventAtTime(BytesDropped{"no-suffix", "ST,", 500}),
       R"("ev":"drop","port":"com1","why":"no-suffix","after_ms":500,"hex":"53542C"})"},
      {"DropWithoutSilence", EventAtTime(BytesDropped{"over-1000", "A", 0}),
       R"("ev":"drop","port":"com1","why":"over-1000","hex":"41"})"},
      {"Lost", EventAtTime(PortChanged{"lost", "EIO", "gone"}),
       R"("ev":"port","port":"com1","state":"lost","errno":"EIO","text":"gone"})"},
      {"Back", EventAtTime(PortChanged{"back", "", "here"}),
       R"("ev":"port","port":"com1","state":"back","text":"here"})"},
      {"Staged", EventAtTime(SettingChanged{"staged", "baud", "19200", "9600"}),
       R"("ev":"setting","port":"com1","state":"staged","key":"baud","value":"19200","previous":"9600"})"},
      {"Console", EventAtTime(ConsoleReplied{"get_stat", true, "Connected"}),
       R"("ev":"console","port":"com1","command":"get_stat","ok":true,"text":"Connected"})"},
      {"Note", EventAtTime(NoteMade{"note"}), R"("ev":"note","port":"com1","text":"note"})"},
      {"Missed", EventAtTime(NoteMade{"note", 3}),
       R"("ev":"note","port":"com1","text":"note","missed":3})"},
      {"Finding", EventAtTime(FindingMade{"differs", "A", "B"}),
       R"("ev":"finding","port":"com1","text":"differs","driver":"41","model":"42"})"},
  };
}

class EventJsonTest : public testing::TestWithParam<Case> {};

TEST_P(EventJsonTest, IsWrittenWithItsKeysInOrder) {
  EXPECT_EQ(ToJsonLine(GetParam().event),
            std::string(R"({"t":"2026-11-21T09:12:03.123456Z",)") + GetParam().line);
}

TEST_P(EventJsonTest, IsReadBack) {
  HostEvent event;
  ASSERT_TRUE(FromJson(nlohmann::json::parse(ToJsonLine(GetParam().event)), &event));
  EXPECT_EQ(ToJsonLine(event), ToJsonLine(GetParam().event));
}

INSTANTIATE_TEST_SUITE_P(Kinds, EventJsonTest, testing::ValuesIn(Cases()),
                         [](const auto& entry) { return std::string(entry.param.name); });

TEST(EventJsonBytesTest, EveryByteSurvivesAndTheLineIsPlainAscii) {
  std::string bytes;
  for (int value = 0; value < 256; ++value) {
    bytes += static_cast<char>(static_cast<unsigned char>(value));
  }
  bytes += "\xC2\x9B";  // valid UTF-8 for the control character that begins an escape sequence
  const std::string line = ToJsonLine(EventAtTime(TokenReceived{1, bytes, 258, 1, -1, false, ""}));
  EXPECT_TRUE(std::all_of(line.begin(), line.end(),
                          [](unsigned char byte) { return byte >= 0x20 && byte < 0x7F; }));
  HostEvent event;
  ASSERT_TRUE(FromJson(nlohmann::json::parse(line), &event));
  EXPECT_EQ(std::get<TokenReceived>(event.detail).bytes, bytes);
}

TEST(EventJsonBytesTest, WhatIsNoEventIsRefused) {
  HostEvent event;
  for (const char* const text :
       {"{}", "[]", "1", R"({"t":"x","ev":"note","port":"com1","text":""})",
        R"({"t":"2026-11-21T09:12:03.123456Z","ev":"bogus","port":"com1"})",
        R"({"t":"2026-11-21T09:12:03.123456Z","ev":"rx","port":"com1","hex":"0"})",
        R"({"t":"2026-11-21T09:12:03.123456Z","ev":"rx","port":"com1"})",
        R"({"t":"2026-11-21T09:12:03.123456Z","ev":"token","port":"com1","n":"1"})"}) {
    EXPECT_FALSE(FromJson(nlohmann::json::parse(text), &event)) << text;
  }
}

}  // namespace
