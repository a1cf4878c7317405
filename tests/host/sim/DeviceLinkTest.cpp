// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>

#include "host/sim/DeviceLink.h"
#include "tests/host/support/TemporaryFolder.h"

namespace {

namespace fs = std::filesystem;

TEST(DeviceLink, PointsToTheTargetAndGoesWithTheObject) {
  const TemporaryFolder folder;
  const std::string path = folder.File("link");
  {
    DeviceLink link(path);
    link.PointTo("/dev/one");
    EXPECT_EQ(fs::read_symlink(path), "/dev/one");
    link.PointTo("/dev/two");
    EXPECT_EQ(fs::read_symlink(path), "/dev/two");
    link.Remove();
    EXPECT_FALSE(fs::is_symlink(fs::symlink_status(path)));
    link.PointTo("/dev/three");
  }
  EXPECT_TRUE(fs::is_empty(folder.Path()));
}

TEST(DeviceLink, ReplacesALinkButNothingElse) {
  const TemporaryFolder folder;
  const std::string path = folder.File("link");
  fs::create_symlink("/dev/old", path);
  DeviceLink(path).PointTo("/dev/new");
  EXPECT_FALSE(fs::is_symlink(fs::symlink_status(path)));
  std::ofstream(path) << "precious";
  {
    DeviceLink link(path);
    EXPECT_THROW(link.PointTo("/dev/new"), std::runtime_error);
  }
  EXPECT_TRUE(fs::is_regular_file(path));
  fs::create_directory(folder.File("folder"));
  DeviceLink ofFolder(folder.File("folder"));
  EXPECT_THROW(ofFolder.PointTo("/dev/new"), std::runtime_error);
}

TEST(DeviceLink, LeavesALinkThatIsSomebodyElsesNow) {
  const TemporaryFolder folder;
  const std::string path = folder.File("link");
  {
    DeviceLink link(path);
    link.PointTo("/dev/one");
    fs::remove(path);
    fs::create_symlink("/dev/other", path);
  }
  EXPECT_EQ(fs::read_symlink(path), "/dev/other");
}

TEST(DeviceLink, SaysWhenTheLinkCannotBeMade) {
  const TemporaryFolder folder;
  DeviceLink link(folder.File("missing/link"));
  EXPECT_THROW(link.PointTo("/dev/one"), std::runtime_error);
  DeviceLink none("");
  EXPECT_NO_THROW(none.PointTo("/dev/one"));
}

}  // namespace
