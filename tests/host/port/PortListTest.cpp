// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <fstream>

#include "host/port/PortList.h"
#include "tests/host/support/TemporaryFolder.h"

namespace fs = std::filesystem;

namespace {

class PortListTest : public testing::Test {
 protected:
  void AddClassEntry(const std::string& name, bool withDevice, const std::string& type) {
    fs::create_directories(Class() / name);
    if (withDevice) {
      fs::create_directory(Class() / name / "device");
    }
    if (!type.empty()) {
      std::ofstream(Class() / name / "type") << type << "\n";
    }
  }
  void AddStableName(const std::string& name, const std::string& device) {
    fs::create_directories(Root() / "serial/by-id");
    fs::create_symlink("../../" + device, Root() / "serial/by-id" / name);
  }
  fs::path Class() const { return folder_.Path() / "class"; }
  fs::path Root() const { return folder_.Path() / "dev"; }

  TemporaryFolder folder_;
};

TEST_F(PortListTest, PutsStableNamesFirst) {
  AddClassEntry("ttyACM0", true, "");
  AddClassEntry("ttyS0", true, "4");
  AddClassEntry("ttyUSB0", true, "");
  AddClassEntry("ttyUSB1", true, "");
  AddStableName("usb-B", "ttyUSB0");
  AddStableName("usb-A", "ttyUSB1");
  const auto ports = ListPorts(Class().string(), Root().string());
  ASSERT_EQ(ports.size(), 4U);
  EXPECT_EQ(ports[0].path, (Root() / "serial/by-id/usb-A").string());
  EXPECT_EQ(ports[0].alias, (Root() / "ttyUSB1").string());
  EXPECT_EQ(ports[1].path, (Root() / "serial/by-id/usb-B").string());
  EXPECT_EQ(ports[2].path, (Root() / "ttyACM0").string());
  EXPECT_EQ(ports[2].alias, "");
  EXPECT_EQ(ports[3].path, (Root() / "ttyS0").string());
}

TEST_F(PortListTest, LeavesOutWhatHasNoHardware) {
  AddClassEntry("tty0", false, "");
  AddClassEntry("console", false, "");
  AddClassEntry("ttyS0", true, "0");
  EXPECT_TRUE(ListPorts(Class().string(), Root().string()).empty());
}

TEST_F(PortListTest, KnowsTheNameThatStaysOfADeviceWhoseNumberChanges) {
  fs::create_directories(Root());
  std::ofstream(Root() / "ttyUSB0") << "";
  std::ofstream(Root() / "ttyUSB1") << "";
  AddStableName("usb-A", "ttyUSB1");
  EXPECT_EQ(StableNameOf((Root() / "ttyUSB1").string(), Root().string()),
            (Root() / "serial/by-id/usb-A").string());
  EXPECT_EQ(StableNameOf((Root() / "ttyUSB0").string(), Root().string()), "");
  EXPECT_EQ(StableNameOf((Root() / "ttyUSB9").string(), Root().string()), "");
  EXPECT_TRUE(HasChangingName("/dev/ttyUSB0"));
  EXPECT_TRUE(HasChangingName("/dev/ttyACM12"));
  EXPECT_FALSE(HasChangingName("/dev/ttyS0"));
  EXPECT_FALSE(HasChangingName("/dev/serial/by-id/usb-A"));
}

TEST_F(PortListTest, IsEmptyWithoutTheFolders) {
  EXPECT_TRUE(ListPorts(Class().string(), Root().string()).empty());
}

}  // namespace
