// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <cstdlib>
#include <fstream>

#include "host/runtime/PluginLoader.h"
#include "tests/host/support/TemporaryFolder.h"

namespace {

class PluginLoaderTest : public testing::Test {
 protected:
  void SetUp() override {
    const char* const value = std::getenv("LOKA_PLUGIN");
    former_ = value == nullptr ? "" : value;
    unsetenv("LOKA_PLUGIN");
  }
  void TearDown() override {
    former_.empty() ? unsetenv("LOKA_PLUGIN") : setenv("LOKA_PLUGIN", former_.c_str(), 1);
  }

  std::string former_;
};

TEST_F(PluginLoaderTest, CommandLineWinsAndNothingElseIsTried) {
  setenv("LOKA_PLUGIN", "/env/lib.so", 1);
  EXPECT_EQ(PluginLoader::Candidates("/my/lib.so"), std::vector<std::string>{"/my/lib.so"});
  EXPECT_EQ(PluginLoader::Candidates("lib.so"), std::vector<std::string>{"./lib.so"});
  EXPECT_EQ(PluginLoader::Candidates(""), std::vector<std::string>{"/env/lib.so"});
}

TEST_F(PluginLoaderTest, SearchesBesideTheProgramAndInTheInstalledFolder) {
  const auto folder = std::filesystem::read_symlink("/proc/self/exe").parent_path();
  const std::vector<std::string> expected = {
      (folder / "libLOKA.so").string(),
      (folder.parent_path() / "lib/loka/plugins/libLOKA.so").string()};
  EXPECT_EQ(PluginLoader::Candidates(""), expected);
  setenv("LOKA_PLUGIN", "", 1);
  EXPECT_EQ(PluginLoader::Candidates(""), expected);
}

TEST_F(PluginLoaderTest, SaysWhatWasTried) {
  std::string error;
  EXPECT_EQ(PluginLoader::Load({"/nowhere/a.so", "/nowhere/b.so"}, &error), nullptr);
  EXPECT_EQ(error,
            "no plug-in found; tried /nowhere/a.so, /nowhere/b.so (name one with --plugin FILE or "
            "LOKA_PLUGIN)");
}

TEST_F(PluginLoaderTest, RefusesAFileThatIsNoLibrary) {
  const TemporaryFolder folder;
  std::ofstream(folder.File("x.so")) << "no library";
  std::string error;
  EXPECT_EQ(PluginLoader::Load({folder.File("x.so")}, &error), nullptr);
  EXPECT_EQ(error.rfind("cannot load the plug-in: ", 0), 0U) << error;
}

TEST_F(PluginLoaderTest, RefusesALibraryWithoutTheEntryPoint) {
  std::string error;
  EXPECT_EQ(PluginLoader::Load({"/lib/x86_64-linux-gnu/libm.so.6", "/lib/libm.so.6"}, &error),
            nullptr);
  EXPECT_NE(error.find("it does not offer GetInterfaceFactory"), std::string::npos) << error;
}

}  // namespace
