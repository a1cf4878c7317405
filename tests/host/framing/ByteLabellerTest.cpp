// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "host/framing/ByteLabeller.h"
#include "tests/host/framing/LabelLog.h"

namespace {

constexpr int kPause = -1;

FramingSettings Frame(const std::string& prefix, const std::string& suffix) {
  FramingSettings settings;
  settings.rxPrefix = BytesOfHexText(prefix);
  settings.rxSuffix = BytesOfHexText(suffix);
  return settings;
}

// What the labeller tells about bytes (0 to 255) and silences of 500 ms (kPause).
std::string Labels(const std::string& prefix, const std::string& suffix,
                   const std::vector<int>& line) {
  LabelLog log;
  ByteLabeller labeller(Frame(prefix, suffix), &log);
  for (const int event : line) {
    if (event == kPause) {
      labeller.OnSilence(500);
    } else {
      labeller.OnBytes(std::string(1, static_cast<char>(event)));
    }
  }
  EXPECT_TRUE(log.IsGapless());
  return log.Text();
}

TEST(ByteLabeller, PrefixAndSuffix) {
  EXPECT_EQ(Labels("02", "03", {2, 'A', 'B', 3}), "02 prefix | 41 42 body | 03 suffix = \"AB\"");
  EXPECT_EQ(Labels("02", "03", {2, 3}), "02 prefix | 03 suffix = \"\"");
  EXPECT_EQ(Labels("02", "03", {2, 2, 3}), "02 prefix | 02 body | 03 suffix = \"\\x02\"");
  EXPECT_EQ(Labels("02", "0D0A", {2, 13, 13, 10}), "02 prefix | 0D body | 0D 0A suffix = \"\\r\"");
}

TEST(ByteLabeller, SuffixIsNeverTakenFromThePrefix) {
  EXPECT_EQ(Labels("0203", "0303", {2, 3, 3, 3}), "02 03 prefix | 03 03 suffix = \"\"");
  EXPECT_EQ(Labels("02", "0203", {2, 3, 2, 3}), "02 prefix | 03 body | 02 03 suffix = \"\\x03\"");
}

TEST(ByteLabeller, PrefixRestartsAtTheByteThatBreaksItOff) {
  EXPECT_EQ(Labels("0202", "03", {2, 5, 2, 2, 'A', 3}),
            "02 05 prefix-restart | 02 02 prefix | 41 body | 03 suffix = \"A\"");
  EXPECT_EQ(Labels("0203", "04", {2, 2, 3, 4}),
            "02 prefix-restart | 02 03 prefix | 04 suffix = \"\"");
  // The prefix would begin inside what was broken off; that is not looked at.
  EXPECT_EQ(Labels("020203", "04", {2, 2, 2, 3, 4, kPause}),
            "02 02 prefix-restart | 02 03 prefix-restart | 04 no-prefix");
}

TEST(ByteLabeller, BytesOutsideFramesAreToldInOnePiece) {
  EXPECT_EQ(Labels("02", "03", {'x', 'y', 2, 3}), "78 79 no-prefix | 02 prefix | 03 suffix = \"\"");
  EXPECT_EQ(Labels("02", "03", {2, 3, 'x', kPause, 'y', kPause}),
            "02 prefix | 03 suffix = \"\" | 78 no-prefix | 79 no-prefix");
  EXPECT_EQ(Labels("0202", "03", {'x', 2, 'y', 'z', kPause}),
            "78 no-prefix | 02 79 prefix-restart | 7A no-prefix");
}

TEST(ByteLabeller, SilenceDropsWhatHasNoSuffix) {
  EXPECT_EQ(Labels("0202", "03", {2, kPause}), "02 partial-prefix 500");
  EXPECT_EQ(Labels("02", "03", {2, kPause}), "02 no-suffix 500");
  EXPECT_EQ(Labels("02", "03", {2, 'A', kPause, 'B', 3, kPause}),
            "02 41 no-suffix 500 | 42 03 no-prefix");
  EXPECT_EQ(Labels("", "03", {'A', kPause, 'B', 3}),
            "41 no-suffix 500 | 42 body | 03 suffix = \"B\"");
}

TEST(ByteLabeller, PrefixOnly) {
  EXPECT_EQ(Labels("02", "", {2, 'A', 2, 'B', kPause}),
            "02 prefix | 41 body = \"A\" | 02 prefix | 42 body = \"B\"");
  EXPECT_EQ(Labels("02", "", {2, 2}), "02 prefix = \"\"");
  EXPECT_EQ(Labels("02", "", {2, kPause}), "02 no-body 500");
  EXPECT_EQ(Labels("02", "", {2, 'A', 2, kPause, 'C', kPause}),
            "02 prefix | 41 body = \"A\" | 02 no-body 500 | 43 no-prefix");
}

TEST(ByteLabeller, PrefixThatOverlapsItselfMakesAnEmptyToken) {
  EXPECT_EQ(Labels("0202", "", {2, 2, 2, kPause}), "02 02 prefix = \"\" | 02 no-body 500");
  EXPECT_EQ(Labels("0202", "", {2, 2, 2, 2, 'A', kPause}),
            "02 02 prefix = \"\" | 02 prefix = \"\" | 02 prefix | 41 body = \"A\"");
}

TEST(ByteLabeller, WithoutPrefixAndSuffixOnlySilenceEndsAToken) {
  EXPECT_EQ(Labels("", "", {2, 'A', kPause, kPause, 'B', kPause}),
            "02 41 body = \"\\x02A\" | 42 body = \"B\"");
}

TEST(ByteLabeller, FrameOfMoreThan1000BytesIsDropped) {
  for (const std::size_t bodyBytes : {997U, 998U, 999U, 1000U}) {
    LabelLog log;
    ByteLabeller labeller(Frame("02", "0304"), &log);
    labeller.OnBytes("\x02" + std::string(bodyBytes, 'a') + "\x03\x04");
    labeller.OnSilence(500);
    // The suffix is looked at before the length, and the length counts what stands in the frame.
    EXPECT_EQ(log.Tokens().size(), bodyBytes <= 998 ? 1U : 0U) << bodyBytes;
    EXPECT_EQ(log.Text().find("over-1000") != std::string::npos, bodyBytes > 998) << bodyBytes;
    EXPECT_EQ(log.Told().size(), bodyBytes + 3);
    EXPECT_TRUE(log.IsGapless());
  }
  LabelLog log;
  ByteLabeller labeller(Frame("", ""), &log);
  labeller.OnBytes(std::string(1003, 'a'));
  labeller.OnSilence(500);
  ASSERT_EQ(log.Tokens().size(), 1U);
  EXPECT_EQ(log.Tokens()[0].bytes, "aa");
}

TEST(ByteLabeller, PrefixOnlyDropsALongFrameWithTheNextPrefixStillToCome) {
  LabelLog log;
  ByteLabeller labeller(Frame("02", ""), &log);
  labeller.OnBytes("\x02" + std::string(1000, 'a') + "bc\x02z");
  labeller.OnSilence(500);
  ASSERT_EQ(log.Tokens().size(), 1U);
  EXPECT_EQ(log.Tokens()[0].bytes, "z");
  EXPECT_TRUE(log.IsGapless());
}

TEST(ByteLabeller, ClosedPortDropsWhatIsOpen) {
  LabelLog log;
  ByteLabeller labeller(Frame("02", "03"), &log);
  labeller.OnBytes(
      "x\x02"
      "A");
  EXPECT_EQ(labeller.OpenBytes(), 3U);
  labeller.OnDisconnected();
  EXPECT_EQ(labeller.OpenBytes(), 0U);
  labeller.OnBytes(
      "\x02"
      "B\x03");
  EXPECT_EQ(log.Text(),
            "78 no-prefix | 02 41 disconnected | 02 prefix | 42 body | 03 suffix = \"B\"");
}

TEST(ByteLabeller, ChangedSettingsHoldFromTheNextPassOn) {
  LabelLog log;
  ByteLabeller labeller(Frame("02", "03"), &log);
  labeller.OnBytes(
      "\x02"
      "A");
  labeller.ChangeSettings(Frame("", "04"));
  EXPECT_EQ(labeller.Settings(), Frame("02", "03"));
  labeller.OnBytes("B\x03");
  EXPECT_EQ(labeller.Settings(), Frame("", "04"));
  labeller.OnBytes("C\x03\x04");
  EXPECT_EQ(log.Text(),
            "02 prefix | 41 42 body | 03 suffix = \"AB\" | 43 03 body | 04 suffix = \"C\\x03\"");
  log.Clear();
  // The pass that waits for its first byte already has its settings; a silence ends it.
  labeller.ChangeSettings(Frame("", "05"));
  EXPECT_EQ(labeller.Settings(), Frame("", "04"));
  labeller.OnSilence(500);
  EXPECT_EQ(labeller.Settings(), Frame("", "05"));
}

TEST(ByteLabeller, SettingsHoldAtOnceWhileThePortIsClosed) {
  LabelLog log;
  ByteLabeller labeller(Frame("02", "03"), &log);
  labeller.ChangeSettings(Frame("", "04"));
  EXPECT_EQ(labeller.Settings(), Frame("", "04"));
  labeller.OnBytes("A");
  labeller.OnDisconnected();
  labeller.ChangeSettings(Frame("", "05"));
  EXPECT_EQ(labeller.Settings(), Frame("", "05"));
}

TEST(ByteLabeller, TellsWhereATokenStoodOnTheLine) {
  LabelLog log;
  ByteLabeller labeller(Frame("02", ""), &log);
  labeller.OnBytes(
      "xx\x02"
      "AB\x02"
      "C");
  labeller.OnSilence(500);
  ASSERT_EQ(log.Tokens().size(), 2U);
  EXPECT_EQ(log.Tokens()[0].offset, 2U);
  EXPECT_EQ(log.Tokens()[0].endOffset, 6U);
  EXPECT_EQ(log.Tokens()[1].offset, 5U);
  EXPECT_EQ(log.Tokens()[1].endOffset, 7U);
}

TEST(ByteLabeller, EndlessStraysAreToldInPieces) {
  LabelLog log;
  ByteLabeller labeller(Frame("02", "03"), &log);
  labeller.OnBytes(std::string(100000, 'x'));
  EXPECT_LT(labeller.OpenBytes(), 1000U);
  EXPECT_TRUE(log.IsGapless());
}

}  // namespace
