// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "host/port/PortMap.h"

namespace {

std::string ErrorOf(PortMap* map, const std::string& word) {
  std::string error;
  EXPECT_FALSE(map->Add(word, &error)) << word;
  return error;
}

TEST(PortMap, MapsNamesToPaths) {
  PortMap map;
  std::string error;
  EXPECT_TRUE(map.IsEmpty());
  ASSERT_TRUE(map.Add("com1=/dev/ttyUSB0", &error));
  ASSERT_TRUE(map.Add("com16=/dev/ttyS1", &error));
  EXPECT_FALSE(map.IsEmpty());
  EXPECT_EQ(map.PathFor("com1"), "/dev/ttyUSB0");
  EXPECT_EQ(map.PathFor("com16"), "/dev/ttyS1");
  EXPECT_EQ(map.PathFor("com2"), "");
}

TEST(PortMap, BarePathStandsForEveryOtherName) {
  PortMap map;
  std::string error;
  ASSERT_TRUE(map.Add("com2=/dev/ttyS1", &error));
  ASSERT_TRUE(map.Add("/dev/pts/3", &error));
  EXPECT_EQ(map.PathFor("com1"), "/dev/pts/3");
  EXPECT_EQ(map.PathFor("anything"), "/dev/pts/3");
  EXPECT_EQ(map.PathFor("com2"), "/dev/ttyS1");
}

TEST(PortMap, PathMayHoldAnEqualsSign) {
  PortMap map;
  std::string error;
  ASSERT_TRUE(map.Add("com1=/dev/a=b", &error));
  ASSERT_TRUE(map.Add("/dev/serial/by-id/x=y", &error));
  EXPECT_EQ(map.PathFor("com1"), "/dev/a=b");
  EXPECT_EQ(map.PathFor("com3"), "/dev/serial/by-id/x=y");
}

TEST(PortMap, RefusesOtherNames) {
  PortMap map;
  for (const char* const name : {"com0", "com17", "com01", "COM1", "com", "com1 ", "tty", ""}) {
    EXPECT_EQ(ErrorOf(&map, std::string(name) + "=/dev/x"),
              "'" + std::string(name) + "' is no port name; com1 to com16 are");
  }
  EXPECT_TRUE(map.IsEmpty());
}

TEST(PortMap, RefusesMissingPathsAndSecondEntries) {
  PortMap map;
  std::string error;
  EXPECT_EQ(ErrorOf(&map, ""), "a port needs a path");
  EXPECT_EQ(ErrorOf(&map, "com1="), "a path is missing behind 'com1='");
  ASSERT_TRUE(map.Add("com1=/dev/a", &error));
  EXPECT_EQ(ErrorOf(&map, "com1=/dev/b"), "com1 is given twice");
  ASSERT_TRUE(map.Add("/dev/c", &error));
  EXPECT_EQ(ErrorOf(&map, "/dev/d"), "only one port can be given without a name");
  EXPECT_EQ(map.PathFor("com1"), "/dev/a");
  EXPECT_EQ(map.PathFor("com2"), "/dev/c");
}

}  // namespace
