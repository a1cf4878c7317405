// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <fstream>

#include "host/control/ControlPath.h"
#include "tests/host/control/ControlFolder.h"
#include "tests/host/support/FileMode.h"

namespace {

TEST(ControlPath, FollowsTheEnvironment) {
  (void)setenv("XDG_RUNTIME_DIR", "/run/user/7", 1);
  {
    const ControlFolderForTest folder;
    EXPECT_EQ(ControlFolder(), folder.Path());
    EXPECT_EQ(ControlPath("com2"), folder.File("com2.sock"));
  }
  EXPECT_EQ(ControlFolder(), "/run/user/7/loka");
  (void)unsetenv("XDG_RUNTIME_DIR");
  EXPECT_EQ(ControlFolder(), "/tmp/loka-" + std::to_string(getuid()));
}

TEST(ControlPath, MakesAFolderForThisUserAlone) {
  const ControlFolderForTest folder;
  std::string error;
  EXPECT_TRUE(MakeControlFolder(&error)) << error;
  EXPECT_EQ(ModeOf(folder.Path()), 0700U);
  EXPECT_TRUE(MakeControlFolder(&error)) << error;
}

TEST(ControlPath, RefusesAFolderThatLetsOthersIn) {
  const ControlFolderForTest folder;
  for (const mode_t mode : {0755U, 0710U, 0701U}) {
    ASSERT_EQ(mkdir(folder.Path().c_str(), 0700), 0);
    ASSERT_EQ(chmod(folder.Path().c_str(), mode), 0);
    std::string error;
    EXPECT_FALSE(MakeControlFolder(&error));
    EXPECT_NE(error.find("nobody else can enter (mode 0700)"), std::string::npos) << error;
    EXPECT_EQ(ModeOf(folder.Path()), mode) << "it must be left as it is";
    ASSERT_EQ(rmdir(folder.Path().c_str()), 0);
  }
}

TEST(ControlPath, RefusesAFolderOfAnotherUser) {
  if (geteuid() != 0) {
    GTEST_SKIP() << "only root can give a folder away";
  }
  const ControlFolderForTest folder;
  ASSERT_EQ(mkdir(folder.Path().c_str(), 0700), 0);
  ASSERT_EQ(chown(folder.Path().c_str(), 12345, 12345), 0);
  std::string error;
  EXPECT_FALSE(MakeControlFolder(&error));
}

TEST(ControlPath, RefusesALinkAndAFile) {
  const ControlFolderForTest folder;
  const std::string target = folder.Parent().File("elsewhere");
  ASSERT_EQ(mkdir(target.c_str(), 0700), 0);
  ASSERT_EQ(symlink(target.c_str(), folder.Path().c_str()), 0);
  std::string error;
  EXPECT_FALSE(MakeControlFolder(&error));
  ASSERT_EQ(unlink(folder.Path().c_str()), 0);
  std::ofstream(folder.Path()) << "a file";
  EXPECT_FALSE(MakeControlFolder(&error));
}

TEST(ControlPath, ListsSocketsByName) {
  const ControlFolderForTest folder;
  EXPECT_TRUE(ControlNames().empty());
  std::string error;
  ASSERT_TRUE(MakeControlFolder(&error)) << error;
  for (const char* const name : {"com2.sock", "com1.sock", "com1.sock.lock", "notes"}) {
    std::ofstream(folder.File(name)) << "";
  }
  EXPECT_EQ(ControlNames(), (std::vector<std::string>{"com1", "com2"}));
}

}  // namespace
