// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <set>
#include <string>

#include "driver/SerialSettings.h"
#include "interfaces/ISerialPort.h"

TEST(SerialSettingsTest, CodesAreTheHosts) {
  EXPECT_EQ(kParityNone, 0);
  EXPECT_EQ(kParityMark, 3);
  EXPECT_EQ(kParitySpace, 4);
  EXPECT_EQ(kModeRs232, 0);
  EXPECT_EQ(kModeRs422, 2);
}

TEST(SerialSettingsTest, ConfiguredParities) {
  EXPECT_EQ(ParityFromConfig("none"), 0);
  EXPECT_EQ(ParityFromConfig("even"), 1);
  EXPECT_EQ(ParityFromConfig("odd"), 2);
  EXPECT_EQ(ParityFromConfig("mark"), 3);
  for (const std::string word : {"space", "None", "EVEN", "", " odd", "1"}) {
    EXPECT_FALSE(ParityFromConfig(word).has_value()) << word;
  }
}

TEST(SerialSettingsTest, ConfiguredModes) {
  EXPECT_EQ(ModeFromConfig("RS-232"), 0);
  EXPECT_EQ(ModeFromConfig("RS-485"), 1);
  EXPECT_EQ(ModeFromConfig("RS-422"), 2);
  for (const std::string word : {"RS-485P", "rs-232", "RS232", "", "0"}) {
    EXPECT_FALSE(ModeFromConfig(word).has_value()) << word;
  }
}

TEST(SerialSettingsTest, NamesOfCodes) {
  EXPECT_STREQ(ParityName(0), "none");
  EXPECT_STREQ(ParityName(1), "even");
  EXPECT_STREQ(ParityName(2), "odd");
  EXPECT_STREQ(ParityName(3), "mark");
  EXPECT_STREQ(ParityName(4), "space");
  EXPECT_STREQ(ModeName(0), "RS-232");
  EXPECT_STREQ(ModeName(1), "RS-485");
  EXPECT_STREQ(ModeName(2), "RS-422");
  EXPECT_STREQ(ModeName(3), "RS-485P");
}

TEST(SerialSettingsTest, UnknownCodesHaveTheFirstName) {
  for (const int code : {-1, 5, 100, 2147483647, -2147483647 - 1}) {
    EXPECT_STREQ(ParityName(code), "none") << code;
  }
  for (const int code : {-1, 4, 100, 2147483647, -2147483647 - 1}) {
    EXPECT_STREQ(ModeName(code), "RS-232") << code;
  }
}

TEST(SerialSettingsTest, ListsElevenBaudRates) {
  const std::set<int> rates = {150, 300, 600, 1200, 2400, 4800, 9600, 19200, 38400, 57600, 115200};
  int listed = 0;
  for (int rate = -1; rate <= 300000; ++rate) {
    listed += IsListedBaudrate(rate) ? 1 : 0;
    ASSERT_EQ(IsListedBaudrate(rate), rates.count(rate) != 0) << rate;
  }
  EXPECT_EQ(listed, 11);
  EXPECT_FALSE(IsListedBaudrate(115000));
}

TEST(SerialSettingsTest, RunTimeRanges) {
  for (int value = -2; value < 260; ++value) {
    EXPECT_EQ(IsParityCode(value), value >= 0 && value <= 4) << value;
    EXPECT_EQ(IsDataBits(value), value == 7 || value == 8) << value;
    EXPECT_EQ(IsStopBits(value), value == 1 || value == 2) << value;
    EXPECT_EQ(IsSettableMode(value), value >= 0 && value <= 2) << value;
  }
}

TEST(SerialSettingsTest, EqualityComparesEveryField) {
  const SerialSettings settings = {9600, 1, 8, 1, 0};
  EXPECT_TRUE(settings == (SerialSettings{9600, 1, 8, 1, 0}));
  EXPECT_FALSE(settings == (SerialSettings{9601, 1, 8, 1, 0}));
  EXPECT_FALSE(settings == (SerialSettings{9600, 2, 8, 1, 0}));
  EXPECT_FALSE(settings == (SerialSettings{9600, 1, 7, 1, 0}));
  EXPECT_FALSE(settings == (SerialSettings{9600, 1, 8, 2, 0}));
  EXPECT_FALSE(settings == (SerialSettings{9600, 1, 8, 1, 1}));
}
