// SPDX-License-Identifier: Apache-2.0
// Stands in for the store where SQLite is not wanted: nothing is ever opened, so that nothing else
// is called.
#include "host/store/SqliteFile.h"

bool SqliteFile::IsBuiltIn() { return false; }

std::unique_ptr<SqliteFile> SqliteFile::Open(const std::string& /*path*/, std::string* error) {
  *error = "this loka was built without a store (LOKA_WITH_STORE); use --no-store";
  return nullptr;
}

void SqliteFile::StatementCloser::operator()(sqlite3_stmt* /*statement*/) const {}
void SqliteFile::DatabaseCloser::operator()(sqlite3* /*database*/) const {}
SqliteFile::~SqliteFile() = default;

bool SqliteFile::Store(const Values& /*values*/, std::string* /*error*/) { return false; }
std::optional<StoredValue> SqliteFile::Find(const StoredKey& /*key*/) { return std::nullopt; }
SqliteFile::Values SqliteFile::All(const std::string& /*ident*/) { return {}; }
bool SqliteFile::ReadAll(Values* /*values*/, std::string* /*error*/) { return false; }
bool SqliteFile::Remove(const std::vector<StoredKey>& /*keys*/, std::string* /*error*/) {
  return false;
}
