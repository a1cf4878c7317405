// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <cstdlib>
#include <map>

#include "host/store/StorePath.h"

namespace {

class StorePathTest : public testing::Test {
 protected:
  StorePathTest() {
    for (const char* const name : {"XDG_STATE_HOME", "HOME"}) {
      const char* const value = std::getenv(name);
      former_[name] = value == nullptr ? "" : value;
    }
  }
  ~StorePathTest() override {
    for (const auto& [name, value] : former_) {
      value.empty() ? unsetenv(name.c_str()) : setenv(name.c_str(), value.c_str(), 1);
    }
  }
  std::map<std::string, std::string> former_;
};

TEST_F(StorePathTest, StateFolderFirstThenHome) {
  setenv("HOME", "/home/u", 1);
  setenv("XDG_STATE_HOME", "/state", 1);
  EXPECT_EQ(DefaultStorePath(), "/state/loka/store.db");
  unsetenv("XDG_STATE_HOME");
  EXPECT_EQ(DefaultStorePath(), "/home/u/.local/state/loka/store.db");
}

TEST_F(StorePathTest, RelativeFoldersDoNotCount) {
  setenv("HOME", "/home/u", 1);
  setenv("XDG_STATE_HOME", "state", 1);
  EXPECT_EQ(DefaultStorePath(), "/home/u/.local/state/loka/store.db");
  setenv("XDG_STATE_HOME", "", 1);
  setenv("HOME", "u", 1);
  EXPECT_EQ(DefaultStorePath(), "");
  unsetenv("HOME");
  EXPECT_EQ(DefaultStorePath(), "");
}

}  // namespace
