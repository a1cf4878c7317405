// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "host/store/StoredValue.h"

struct sqlite3;
struct sqlite3_stmt;

// The file behind the storage: one table of typed values in an SQLite database with write-ahead
// log and full synchronisation, so that a transaction that was reported done outlives a kill and a
// power cut (sqlite.org/wal.html, sqlite.org/pragma.html#pragma_synchronous). One thread at a time.
class SqliteFile {
 public:
  using Values = std::map<StoredKey, StoredValue>;
  // Device and number of a file: tells whether its name still leads to it.
  using FileIdentity = std::pair<std::uint64_t, std::uint64_t>;

  // Whether this program has a store at all (LOKA_WITH_STORE).
  static bool IsBuiltIn();

  // Opens the file, or makes it (mode 0600) and the folders that are missing (mode 0700). Null,
  // with the reason in `error`, when that fails, when the file is damaged or when it is not a
  // store of ours; such a file is left as it is.
  static std::unique_ptr<SqliteFile> Open(const std::string& path, std::string* error);

  ~SqliteFile();

  SqliteFile(const SqliteFile&) = delete;
  SqliteFile& operator=(const SqliteFile&) = delete;

  // Stores all values in one transaction, all of them or none. False, with the reason in `error`,
  // when nothing was stored, or when the file was moved away meanwhile, so that nobody would find
  // it. Waits up to 2000 ms for another process to let go of the file.
  bool Store(const Values& values, std::string* error);

  // The stored value, or nothing.
  std::optional<StoredValue> Find(const StoredKey& key);

  // All keys and values of one key space.
  Values All(const std::string& ident);

  // All keys and values of all key spaces. False, with the reason in `error`, when they cannot all
  // be read.
  bool ReadAll(Values* values, std::string* error);

  // Removes keys in one transaction, all of them or none; a key that is not there is none. False,
  // with the reason in `error`, when nothing was removed. Waits as Store does.
  bool Remove(const std::vector<StoredKey>& keys, std::string* error);

 private:
  struct StatementCloser {
    void operator()(sqlite3_stmt* statement) const;
  };
  struct DatabaseCloser {
    void operator()(sqlite3* database) const;
  };
  using Statement = std::unique_ptr<sqlite3_stmt, StatementCloser>;

  SqliteFile() = default;

  bool Connect(const std::string& path, std::string* error);
  bool Check(std::string* error);
  bool Prepare(std::string* error);
  bool RememberFile(std::string* error);
  bool IsInPlace(std::string* error) const;
  bool IsRoomMissing() const;
  bool CheckIsOurs(std::string* error);
  bool CreateTable(std::string* error);
  bool Execute(const char* sql, std::string* error);
  bool InsertAll(const Values& values);
  bool DeleteAll(const std::vector<StoredKey>& keys);
  bool EndTransaction(bool isGood, std::string* error);
  Statement MakeStatement(const char* sql);
  bool QueryText(const char* sql, std::string* answer, std::string* error);
  std::string LastErrorText() const;

  std::string path_;
  std::optional<FileIdentity> file_;
  bool isNew_ = false;
  std::unique_ptr<sqlite3, DatabaseCloser> database_;
};
