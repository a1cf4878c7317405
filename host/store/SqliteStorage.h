// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <thread>

#include "host/store/SqliteFile.h"
#include "host/store/StoredValue.h"
#include "interfaces/IPermanentStorage2.h"

// The host's permanent storage in one file. Any thread.
//
// Every value set outside a batch is a transaction of its own. Values set between BeginBatch and
// EndBatch of one thread are visible to reads of all threads at once, but written together, all or
// none, by EndBatch: the driver sets up to twelve values while it holds its queue semaphore, and no
// byte could be received while it waits for the disk. When writing fails, the values stay in
// memory, and visible, until the program ends.
class SqliteStorage final : public IPermanentStorage2 {
 public:
  // Told when values could not be written, one line. Called without any lock held.
  using FailureHandler = std::function<void(const std::string& text)>;

  // Opens or makes the file (see SqliteFile::Open). Null with the reason in `error`.
  static std::unique_ptr<SqliteStorage> Open(const std::string& path, FailureHandler onFailure,
                                             std::string* error);

  ~SqliteStorage() override;

  SqliteStorage(const SqliteStorage&) = delete;
  SqliteStorage& operator=(const SqliteStorage&) = delete;

  // Answers "SqliteStorage", "IPermanentStorage" and "IPermanentStorage2".
  void* ConvertTo(const char* name) override;
  const char* GetImpName() const override { return "SqliteStorage"; }
  int GetImpVersion() const override { return 100; }

  // A null identifier, key or text counts as the empty text.
  void SetString(const char* ident, const char* key, const char* text) override;
  void SetBoolean(const char* ident, const char* key, bool value) override;
  void SetInteger(const char* ident, const char* key, int value) override;

  // The stored text, valid until the calling thread asks the next time; the empty text when there
  // is none.
  const char* GetString(const char* ident, const char* key) override;
  bool GetBoolean(const char* ident, const char* key) override;
  int GetInteger(const char* ident, const char* key) override;
  int Exists(const char* ident, const char* key) override;
  int GetStringInto(const char* ident, const char* key, char* buffer, int sizeBytes) override;

  // Batches nest and belong to the calling thread; the outermost EndBatch writes. False, with the
  // reason in `error` and told to the failure handler, when the values could not be written.
  void BeginBatch();
  bool EndBatch(std::string* error);

  // Everything that reads see of one key space.
  SqliteFile::Values All(const std::string& ident);

 private:
  struct VisibleValue {
    StoredValue value;
    std::uint64_t number = 0;  // grows with every Set, tells later values from earlier ones
  };
  struct Batch {
    int depth = 0;
    std::map<StoredKey, VisibleValue> values;
  };

  SqliteStorage(std::unique_ptr<SqliteFile> file, FailureHandler onFailure);

  void Set(const char* ident, const char* key, StoredValue value) noexcept;
  std::optional<StoredValue> Get(const char* ident, const char* key) noexcept;
  bool Write(const std::map<StoredKey, VisibleValue>& values, std::string* error);
  void ForgetWritten(const std::map<StoredKey, VisibleValue>& values);

  const FailureHandler onFailure_;

  // Guards what is not in the file yet. Held for moments only, never while the disk works.
  std::mutex memoryMutex_;
  std::map<StoredKey, VisibleValue> visible_;
  std::map<std::thread::id, Batch> batches_;
  std::uint64_t lastNumber_ = 0;

  // Guards the file.
  std::mutex fileMutex_;
  const std::unique_ptr<SqliteFile> file_;
  // The number of the value that the file holds for a key: threads that set the same key may come
  // here in another order, and the value set last must win.
  std::map<StoredKey, std::uint64_t> writtenNumbers_;
};
