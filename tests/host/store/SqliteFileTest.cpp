// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "host/store/SqliteFile.h"
#include "tests/host/support/TemporaryFolder.h"

namespace {

class SqliteFileTest : public testing::Test {
 protected:
  SqliteFileTest() {
    std::string error;
    file_ = SqliteFile::Open(folder_.File("store.db"), &error);
    EXPECT_NE(file_, nullptr) << error;
    EXPECT_TRUE(file_->Store(values_, &error)) << error;
  }
  SqliteFile::Values All() {
    SqliteFile::Values values;
    std::string error;
    EXPECT_TRUE(file_->ReadAll(&values, &error)) << error;
    return values;
  }

  TemporaryFolder folder_;
  const SqliteFile::Values values_ = {{{"a", "baud"}, 9600},
                                      {{"a", "hex"}, true},
                                      {{"b", "baud"}, 300},
                                      {{"b", "x' OR 1=1 --"}, std::string("\xFF")}};
  std::unique_ptr<SqliteFile> file_;
};

TEST_F(SqliteFileTest, ReadsAllKeySpaces) { EXPECT_EQ(All(), values_); }

TEST_F(SqliteFileTest, RemovesExactlyTheKeysThatAreNamed) {
  std::string error;
  EXPECT_TRUE(file_->Remove({{"b", "x' OR 1=1 --"}, {"a", "baud"}, {"a", "absent"}}, &error));
  EXPECT_EQ(All(), (SqliteFile::Values{{{"a", "hex"}, true}, {{"b", "baud"}, 300}}));
  EXPECT_FALSE(file_->Find({"a", "baud"}).has_value());
  EXPECT_TRUE(file_->Remove({}, &error));
  // It stays removed.
  file_.reset();
  file_ = SqliteFile::Open(folder_.File("store.db"), &error);
  ASSERT_NE(file_, nullptr) << error;
  EXPECT_EQ(All().size(), 2U);
}

}  // namespace
