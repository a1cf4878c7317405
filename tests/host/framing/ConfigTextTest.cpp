// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "host/framing/ConfigText.h"

namespace {

TEST(ConfigText, FindsAValueUpToWhiteSpace) {
  EXPECT_EQ(ConfigValue("CfgVer=1 port=com1 baudrate=9600", "port", ""), "com1");
  EXPECT_EQ(ConfigValue("CfgVer=1 port=com1\tbaudrate=9600\n", "baudrate", ""), "9600");
  EXPECT_EQ(ConfigValue("CfgVer=1port=com3", "port", ""), "com3");
}

TEST(ConfigText, TakesWholeKeysOnly) {
  EXPECT_EQ(ConfigValue("CfgVer=1 xport=com5 Node1::port=com6 port=com1", "port", ""), "com1");
}

TEST(ConfigText, TakesTheFirstOfSeveral) {
  EXPECT_EQ(ConfigValue("CfgVer=1 port=com1 port=com2", "port", ""), "com1");
}

TEST(ConfigText, LooksIntoItsOwnSectionOnly) {
  const char* const text = "CfgVer=2 port=com8 CfgVer=1 port=com3 CfgVer=3 port=com9 gap=5";
  EXPECT_EQ(ConfigValue(text, "port", ""), "com3");
  EXPECT_EQ(ConfigValue(text, "gap", "none"), "none");
}

TEST(ConfigText, FallsBackWhenThereIsNoSuchKeyOrSection) {
  EXPECT_EQ(ConfigValue("CfgVer=1 a=b", "port", "fallback"), "fallback");
  EXPECT_EQ(ConfigValue("port=com1", "port", "fallback"), "fallback");
  EXPECT_EQ(ConfigValue("CfgVer=1 port= a=b", "port", "fallback"), "");
}

}  // namespace
