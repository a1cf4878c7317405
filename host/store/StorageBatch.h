// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include "host/store/SqliteStorage.h"

// Puts everything that the calling thread stores during its life into one transaction. Used around
// each tag write. One thread.
class StorageBatch {
 public:
  // The storage may be null; the batch then does nothing.
  explicit StorageBatch(SqliteStorage* storage) : storage_(storage) {
    if (storage_ != nullptr) {
      storage_->BeginBatch();
    }
  }

  ~StorageBatch() {
    std::string error;
    (void)End(&error);
  }

  StorageBatch(const StorageBatch&) = delete;
  StorageBatch& operator=(const StorageBatch&) = delete;

  // Writes now. False with the reason in `error`, as SqliteStorage::EndBatch. A second call does
  // nothing.
  bool End(std::string* error) {
    SqliteStorage* const storage = storage_;
    storage_ = nullptr;
    return storage == nullptr || storage->EndBatch(error);
  }

 private:
  SqliteStorage* storage_;
};
