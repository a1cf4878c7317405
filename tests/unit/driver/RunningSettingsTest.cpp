// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <atomic>
#include <string>
#include <thread>

#include "driver/RunningSettings.h"

TEST(RunningSettingsTest, StartsEmpty) {
  const RunningSettings settings;
  EXPECT_TRUE(settings.Serial() == SerialSettings());
  for (const FramingText which : {FramingText::kRxPrefix, FramingText::kRxSuffix,
                                  FramingText::kTxPrefix, FramingText::kTxSuffix}) {
    EXPECT_EQ(settings.Text(which), "");
  }
  EXPECT_EQ(settings.GapMs(), 0);
  EXPECT_FALSE(settings.HexTokens());
  EXPECT_EQ(settings.TokenQueueSize(), 0);
}

TEST(RunningSettingsTest, KeepsWhatIsSet) {
  RunningSettings settings;
  settings.SetSerial({9600, 1, 8, 2, 0});
  settings.SetText(FramingText::kRxPrefix, "01");
  settings.SetText(FramingText::kRxSuffix, "02");
  settings.SetText(FramingText::kTxPrefix, "03");
  settings.SetText(FramingText::kTxSuffix, "04");
  settings.SetGapMs(25);
  settings.SetHexTokens(true);
  settings.SetTokenQueueSize(-3);
  EXPECT_TRUE(settings.Serial() == (SerialSettings{9600, 1, 8, 2, 0}));
  EXPECT_EQ(settings.Text(FramingText::kRxPrefix), "01");
  EXPECT_EQ(settings.Text(FramingText::kRxSuffix), "02");
  EXPECT_EQ(settings.Text(FramingText::kTxPrefix), "03");
  EXPECT_EQ(settings.Text(FramingText::kTxSuffix), "04");
  EXPECT_EQ(settings.GapMs(), 25);
  EXPECT_TRUE(settings.HexTokens());
  EXPECT_EQ(settings.TokenQueueSize(), -3);
}

TEST(RunningSettingsTest, SnapshotHasTheReceiveFramingAsBytes) {
  RunningSettings settings;
  RxFramingSnapshot snapshot;
  settings.UpdateRxFraming(snapshot);
  EXPECT_EQ(snapshot.framing.prefix, "");
  settings.SetText(FramingText::kRxPrefix, "0202");
  settings.SetText(FramingText::kRxSuffix, "none");
  settings.UpdateRxFraming(snapshot);
  EXPECT_EQ(snapshot.framing.prefix, "\x02\x02");
  EXPECT_EQ(snapshot.framing.suffix, "");
  settings.SetText(FramingText::kRxSuffix, "0d");
  settings.UpdateRxFraming(snapshot);
  EXPECT_EQ(snapshot.framing.suffix, "\x0D");
}

TEST(RunningSettingsTest, SnapshotIsLeftAloneWhileNothingChanges) {
  RunningSettings settings;
  settings.SetText(FramingText::kRxPrefix, "02");
  RxFramingSnapshot snapshot;
  settings.UpdateRxFraming(snapshot);
  snapshot.framing.prefix = "marked";
  settings.SetGapMs(5);
  settings.UpdateRxFraming(snapshot);
  EXPECT_EQ(snapshot.framing.prefix, "marked");
  settings.SetText(FramingText::kRxPrefix, "03");
  settings.UpdateRxFraming(snapshot);
  EXPECT_EQ(snapshot.framing.prefix, "\x03");
}

TEST(RunningSettingsTest, TextsStayWholeWhileAnotherThreadChangesThem) {
  RunningSettings settings;
  const std::string longText(200, '1');
  settings.SetText(FramingText::kRxPrefix, longText);
  std::atomic<bool> done{false};
  std::thread writer([&] {
    for (int i = 0; i < 2000; ++i) {
      settings.SetText(FramingText::kRxPrefix, std::string(200, i % 2 == 0 ? '2' : '1'));
    }
    done = true;
  });
  RxFramingSnapshot snapshot;
  do {
    settings.UpdateRxFraming(snapshot);
    const std::string& prefix = snapshot.framing.prefix;
    ASSERT_EQ(prefix, std::string(100, prefix.empty() ? '?' : prefix[0]));
  } while (!done);
  writer.join();
  settings.UpdateRxFraming(snapshot);
  EXPECT_EQ(snapshot.framing.prefix, std::string(100, '\x11'));
}
