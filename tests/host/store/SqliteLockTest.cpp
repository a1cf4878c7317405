// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>
#include <sqlite3.h>

#include <chrono>
#include <string>
#include <vector>

#include "host/store/SqliteStorage.h"
#include "tests/host/support/TemporaryFolder.h"

namespace {

// Another process in the middle of writing. The storage waits two seconds for it, of which only the
// lower bound is asserted, with a tenth of margin for SQLite's own counting of its waits.
TEST(SqliteLock, WaitsForAnotherWriterAndReportsWhenItStays) {
  const TemporaryFolder folder;
  const std::string path = folder.File("store.db");
  std::vector<std::string> failures;
  std::string error;
  const auto storage = SqliteStorage::Open(
      path, [&](const std::string& text) { failures.push_back(text); }, &error);
  ASSERT_NE(storage, nullptr) << error;
  sqlite3* other = nullptr;
  ASSERT_EQ(sqlite3_open(path.c_str(), &other), SQLITE_OK);
  ASSERT_EQ(sqlite3_exec(other, "BEGIN IMMEDIATE", nullptr, nullptr, nullptr), SQLITE_OK);
  const auto begin = std::chrono::steady_clock::now();
  storage->SetInteger("a", "k", 3);
  EXPECT_GE(std::chrono::steady_clock::now() - begin, std::chrono::milliseconds(1800));
  ASSERT_EQ(failures.size(), 1U);
  EXPECT_EQ(failures[0], "the store " + path +
                             " is locked by another process; the values hold until the program "
                             "ends");
  EXPECT_EQ(storage->GetInteger("a", "k"), 3);
  sqlite3_close(other);
  storage->SetInteger("a", "k", 4);
  EXPECT_EQ(failures.size(), 1U);
}

}  // namespace
