// SPDX-License-Identifier: Apache-2.0
#include "host/store/SqliteFile.h"

#include <fcntl.h>
#include <sqlite3.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <filesystem>
#include <system_error>

#include "host/base/SystemError.h"

namespace fs = std::filesystem;

namespace {

constexpr int kBusyTimeoutMs = 2000;
constexpr int kPrimaryCodeMask = 0xFF;  // of an extended result code
// Marks the file as a store of this program ("loka" in ASCII).
constexpr int kApplicationId = 0x6C6F6B61;

enum ValueKind : int { kKindBoolean = 0, kKindInteger = 1, kKindText = 2 };

// Makes the folder and those above it that are missing, for this user alone.
bool MakeFolders(const fs::path& folder, std::string* error) {
  std::error_code ignored;
  if (folder.empty() || fs::is_directory(folder, ignored)) {
    return true;
  }
  if (!MakeFolders(folder.parent_path(), error)) {
    return false;
  }
  if (mkdir(folder.c_str(), S_IRWXU) != 0 && errno != EEXIST) {
    *error = "cannot make the folder " + folder.string() + ": " + SystemErrorText(errno);
    return false;
  }
  return true;
}

// Makes the file before SQLite does, because SQLite leaves the rights to the umask. The log files
// beside it take over its rights.
bool MakeFile(const std::string& path, std::string* error) {
  const int descriptor = open(path.c_str(), O_RDWR | O_CREAT | O_CLOEXEC, S_IRUSR | S_IWUSR);
  if (descriptor < 0) {
    *error = "cannot open the store " + path + ": " + SystemErrorText(errno);
    return false;
  }
  (void)close(descriptor);
  return true;
}

std::optional<SqliteFile::FileIdentity> FindFile(const std::string& path) {
  struct stat status {};
  if (stat(path.c_str(), &status) != 0) {
    return std::nullopt;
  }
  return SqliteFile::FileIdentity(status.st_dev, status.st_ino);
}

bool BindText(sqlite3_stmt* statement, int column, const std::string& text) {
  return sqlite3_bind_text64(statement, column, text.data(), text.size(), SQLITE_TRANSIENT,
                             SQLITE_UTF8) == SQLITE_OK;
}

bool BindValue(sqlite3_stmt* statement, int kindColumn, int valueColumn, const StoredValue& value) {
  int result = SQLITE_OK;
  if (const auto* const text = std::get_if<std::string>(&value)) {
    result = BindText(statement, valueColumn, *text) ? SQLITE_OK : SQLITE_ERROR;
  } else if (const auto* const number = std::get_if<int>(&value)) {
    result = sqlite3_bind_int(statement, valueColumn, *number);
  } else {
    result = sqlite3_bind_int(statement, valueColumn, std::get<bool>(value) ? 1 : 0);
  }
  const auto kind = static_cast<int>(value.index());
  return result == SQLITE_OK && sqlite3_bind_int(statement, kindColumn, kind) == SQLITE_OK;
}

std::string ColumnText(sqlite3_stmt* statement, int column) {
  const void* const bytes = sqlite3_column_blob(statement, column);
  const int length = sqlite3_column_bytes(statement, column);
  return bytes == nullptr
             ? std::string()
             : std::string(static_cast<const char*>(bytes), static_cast<std::size_t>(length));
}

StoredValue ColumnValue(sqlite3_stmt* statement, int kindColumn, int valueColumn) {
  switch (sqlite3_column_int(statement, kindColumn)) {
    case kKindBoolean:
      return sqlite3_column_int(statement, valueColumn) != 0;
    case kKindInteger:
      return sqlite3_column_int(statement, valueColumn);
    default:
      return ColumnText(statement, valueColumn);
  }
}

}  // namespace

void SqliteFile::StatementCloser::operator()(sqlite3_stmt* statement) const {
  (void)sqlite3_finalize(statement);
}

void SqliteFile::DatabaseCloser::operator()(sqlite3* database) const {
  (void)sqlite3_close(database);
}

SqliteFile::~SqliteFile() = default;

bool SqliteFile::IsBuiltIn() { return true; }

std::unique_ptr<SqliteFile> SqliteFile::Open(const std::string& path, std::string* error) {
  if (!MakeFolders(fs::path(path).parent_path(), error) || !MakeFile(path, error)) {
    return nullptr;
  }
  auto file = std::unique_ptr<SqliteFile>(new SqliteFile());
  file->path_ = path;
  if (!file->Connect(path, error) || !file->Check(error) || !file->Prepare(error)) {
    return nullptr;
  }
  return file;
}

// Where there is no room for the index that processes share, a process alone can still read.
bool SqliteFile::Check(std::string* error) {
  return CheckIsOurs(error) ||
         (IsRoomMissing() && Connect(path_, error) &&
          Execute("PRAGMA locking_mode = EXCLUSIVE", error) && CheckIsOurs(error));
}

// A store that is there is not written to: it must open on a full disk, too.
bool SqliteFile::Prepare(std::string* error) {
  return Execute("PRAGMA synchronous = FULL", error) && (!isNew_ || CreateTable(error)) &&
         RememberFile(error);
}

bool SqliteFile::Connect(const std::string& path, std::string* error) {
  sqlite3* database = nullptr;
  const int result = sqlite3_open_v2(path.c_str(), &database,
                                     SQLITE_OPEN_READWRITE | SQLITE_OPEN_NOMUTEX, nullptr);
  database_.reset(database);
  if (result != SQLITE_OK) {
    *error = LastErrorText();
    return false;
  }
  (void)sqlite3_extended_result_codes(database, 1);
  return sqlite3_busy_timeout(database, kBusyTimeoutMs) == SQLITE_OK;
}

// Only questions, so that a file that is damaged or belongs to another program stays as it is.
bool SqliteFile::CheckIsOurs(std::string* error) {
  std::string tables;
  std::string applicationId;
  std::string check;
  if (!QueryText("SELECT count(*) FROM sqlite_master", &tables, error) ||
      !QueryText("PRAGMA application_id", &applicationId, error) ||
      !QueryText("PRAGMA quick_check(1)", &check, error)) {
    return false;
  }
  if (check != "ok") {
    *error = "the store " + path_ + " is damaged (" + check +
             ") and was left as it is; move it away or choose another file";
    return false;
  }
  isNew_ = tables == "0" && applicationId == "0";
  if (!isNew_ && applicationId != std::to_string(kApplicationId)) {
    *error = path_ + " is a database of another program and was left as it is; choose another file";
    return false;
  }
  return true;
}

bool SqliteFile::CreateTable(std::string* error) {
  const std::string mark = "PRAGMA application_id = " + std::to_string(kApplicationId);
  return Execute("PRAGMA journal_mode = WAL", error) && Execute("BEGIN IMMEDIATE", error) &&
         Execute(
             "CREATE TABLE IF NOT EXISTS setting (ident TEXT NOT NULL, key TEXT NOT NULL, "
             "kind INTEGER NOT NULL, value, PRIMARY KEY (ident, key)) WITHOUT ROWID",
             error) &&
         Execute(mark.c_str(), error) && Execute("COMMIT", error);
}

bool SqliteFile::RememberFile(std::string* error) {
  file_ = FindFile(path_);
  if (!file_) {
    *error = "cannot open the store " + path_ + ": " + SystemErrorText(errno);
  }
  return file_.has_value();
}

// SQLite goes on with a file that has lost its name, and nobody would ever find what it stores
// there.
bool SqliteFile::IsInPlace(std::string* error) const {
  if (FindFile(path_) == file_) {
    return true;
  }
  *error = "the store " + path_ + " was moved or removed";
  return false;
}

bool SqliteFile::IsRoomMissing() const {
  const int code = sqlite3_extended_errcode(database_.get()) & kPrimaryCodeMask;
  return code == SQLITE_FULL || code == SQLITE_IOERR || code == SQLITE_CANTOPEN;
}

bool SqliteFile::Execute(const char* sql, std::string* error) {
  if (sqlite3_exec(database_.get(), sql, nullptr, nullptr, nullptr) == SQLITE_OK) {
    return true;
  }
  *error = LastErrorText();
  return false;
}

SqliteFile::Statement SqliteFile::MakeStatement(const char* sql) {
  sqlite3_stmt* statement = nullptr;
  (void)sqlite3_prepare_v2(database_.get(), sql, -1, &statement, nullptr);
  return Statement(statement);
}

bool SqliteFile::QueryText(const char* sql, std::string* answer, std::string* error) {
  const Statement statement = MakeStatement(sql);
  if (statement == nullptr || sqlite3_step(statement.get()) != SQLITE_ROW) {
    *error = LastErrorText();
    return false;
  }
  *answer = ColumnText(statement.get(), 0);
  return true;
}

bool SqliteFile::InsertAll(const Values& values) {
  const Statement insert = MakeStatement(
      "INSERT INTO setting (ident, key, kind, value) VALUES (?1, ?2, ?3, ?4) "
      "ON CONFLICT (ident, key) DO UPDATE SET kind = ?3, value = ?4");
  if (insert == nullptr) {
    return false;
  }
  return std::all_of(values.begin(), values.end(), [&](const auto& entry) {
    const auto& [key, value] = entry;
    return BindText(insert.get(), 1, key.first) && BindText(insert.get(), 2, key.second) &&
           BindValue(insert.get(), 3, 4, value) && sqlite3_step(insert.get()) == SQLITE_DONE &&
           sqlite3_reset(insert.get()) == SQLITE_OK;
  });
}

bool SqliteFile::Store(const Values& values, std::string* error) {
  if (!Execute("BEGIN IMMEDIATE", error)) {
    return false;
  }
  return EndTransaction(InsertAll(values), error);
}

bool SqliteFile::EndTransaction(bool isGood, std::string* error) {
  if (isGood && Execute("COMMIT", error)) {
    return IsInPlace(error);
  }
  *error = LastErrorText();
  if (sqlite3_get_autocommit(database_.get()) == 0) {
    (void)sqlite3_exec(database_.get(), "ROLLBACK", nullptr, nullptr, nullptr);
  }
  return false;
}

std::optional<StoredValue> SqliteFile::Find(const StoredKey& key) {
  const Statement query =
      MakeStatement("SELECT kind, value FROM setting WHERE ident = ?1 AND key = ?2");
  if (query == nullptr || !BindText(query.get(), 1, key.first) ||
      !BindText(query.get(), 2, key.second) || sqlite3_step(query.get()) != SQLITE_ROW) {
    return std::nullopt;
  }
  return ColumnValue(query.get(), 0, 1);
}

SqliteFile::Values SqliteFile::All(const std::string& ident) {
  Values values;
  const Statement query = MakeStatement("SELECT key, kind, value FROM setting WHERE ident = ?1");
  if (query != nullptr && BindText(query.get(), 1, ident)) {
    while (sqlite3_step(query.get()) == SQLITE_ROW) {
      values[{ident, ColumnText(query.get(), 0)}] = ColumnValue(query.get(), 1, 2);
    }
  }
  return values;
}

bool SqliteFile::ReadAll(Values* values, std::string* error) {
  const Statement query = MakeStatement("SELECT ident, key, kind, value FROM setting");
  int result = query == nullptr ? SQLITE_ERROR : sqlite3_step(query.get());
  for (; result == SQLITE_ROW; result = sqlite3_step(query.get())) {
    (*values)[{ColumnText(query.get(), 0), ColumnText(query.get(), 1)}] =
        ColumnValue(query.get(), 2, 3);
  }
  if (result != SQLITE_DONE) {
    *error = LastErrorText();
  }
  return result == SQLITE_DONE;
}

bool SqliteFile::DeleteAll(const std::vector<StoredKey>& keys) {
  const Statement remove = MakeStatement("DELETE FROM setting WHERE ident = ?1 AND key = ?2");
  if (remove == nullptr) {
    return false;
  }
  return std::all_of(keys.begin(), keys.end(), [&](const StoredKey& key) {
    return BindText(remove.get(), 1, key.first) && BindText(remove.get(), 2, key.second) &&
           sqlite3_step(remove.get()) == SQLITE_DONE && sqlite3_reset(remove.get()) == SQLITE_OK;
  });
}

bool SqliteFile::Remove(const std::vector<StoredKey>& keys, std::string* error) {
  return Execute("BEGIN IMMEDIATE", error) && EndTransaction(DeleteAll(keys), error);
}

std::string SqliteFile::LastErrorText() const {
  const std::string store = "the store " + path_;
  switch (sqlite3_extended_errcode(database_.get()) & kPrimaryCodeMask) {
    case SQLITE_FULL:
      return store + " cannot grow: the disk is full";
    case SQLITE_READONLY:
      return store + " is read-only";
    case SQLITE_BUSY:
    case SQLITE_LOCKED:
      return store + " is locked by another process";
    case SQLITE_NOTADB:
    case SQLITE_CORRUPT:
      return store + " is damaged or not a store (" + sqlite3_errmsg(database_.get()) +
             ") and was left as it is; move it away or choose another file";
    case SQLITE_IOERR:
    case SQLITE_CANTOPEN: {
      const int systemError = sqlite3_system_errno(database_.get());
      return store + ": " + sqlite3_errmsg(database_.get()) +
             (systemError == 0 ? "" : " (" + SystemErrorText(systemError) + ")");
    }
    default:
      return store + ": " + sqlite3_errmsg(database_.get());
  }
}
