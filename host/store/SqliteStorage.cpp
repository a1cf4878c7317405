// SPDX-License-Identifier: Apache-2.0
#include "host/store/SqliteStorage.h"

#include <algorithm>
#include <cstring>
#include <exception>
#include <utility>

#include "interfaces/CompareInterface.h"

namespace {

StoredKey MakeKey(const char* ident, const char* key) {
  return {ident == nullptr ? "" : ident, key == nullptr ? "" : key};
}

}  // namespace

SqliteStorage::SqliteStorage(std::unique_ptr<SqliteFile> file, FailureHandler onFailure)
    : onFailure_(std::move(onFailure)), file_(std::move(file)) {}

SqliteStorage::~SqliteStorage() = default;

std::unique_ptr<SqliteStorage> SqliteStorage::Open(const std::string& path,
                                                   FailureHandler onFailure, std::string* error) {
  std::unique_ptr<SqliteFile> file = SqliteFile::Open(path, error);
  if (file == nullptr) {
    return nullptr;
  }
  return std::unique_ptr<SqliteStorage>(new SqliteStorage(std::move(file), std::move(onFailure)));
}

void* SqliteStorage::ConvertTo(const char* name) {
  const bool isOurs = CompareInterface(name, "SqliteStorage") ||
                      CompareInterface(name, "IPermanentStorage") ||
                      CompareInterface(name, "IPermanentStorage2");
  return isOurs ? this : nullptr;
}

void SqliteStorage::SetString(const char* ident, const char* key, const char* text) {
  try {
    Set(ident, key, std::string(text == nullptr ? "" : text));
  } catch (const std::exception&) {
    // Out of memory while copying the text: the value stays as it was.
    return;
  }
}

void SqliteStorage::SetBoolean(const char* ident, const char* key, bool value) {
  Set(ident, key, value);
}

void SqliteStorage::SetInteger(const char* ident, const char* key, int value) {
  Set(ident, key, value);
}

void SqliteStorage::Set(const char* ident, const char* key, StoredValue value) noexcept {
  try {
    const StoredKey storedKey = MakeKey(ident, key);
    VisibleValue visible{std::move(value), 0};
    {
      const std::lock_guard<std::mutex> lock(memoryMutex_);
      visible.number = ++lastNumber_;
      visible_[storedKey] = visible;
      const auto batch = batches_.find(std::this_thread::get_id());
      if (batch != batches_.end()) {
        batch->second.values[storedKey] = std::move(visible);
        return;
      }
    }
    std::string error;
    (void)Write({{storedKey, std::move(visible)}}, &error);
  } catch (const std::exception&) {
    // Out of memory: the value stays as it was.
    return;
  }
}

std::optional<StoredValue> SqliteStorage::Get(const char* ident, const char* key) noexcept {
  try {
    const StoredKey storedKey = MakeKey(ident, key);
    {
      const std::lock_guard<std::mutex> lock(memoryMutex_);
      const auto found = visible_.find(storedKey);
      if (found != visible_.end()) {
        return found->second.value;
      }
    }
    const std::lock_guard<std::mutex> lock(fileMutex_);
    return file_->Find(storedKey);
  } catch (const std::exception&) {
    return std::nullopt;
  }
}

const char* SqliteStorage::GetString(const char* ident, const char* key) {
  thread_local std::string text;
  std::optional<StoredValue> value = Get(ident, key);
  auto* const stored = value.has_value() ? std::get_if<std::string>(&*value) : nullptr;
  text = stored == nullptr ? std::string() : std::move(*stored);
  return text.c_str();
}

bool SqliteStorage::GetBoolean(const char* ident, const char* key) {
  const std::optional<StoredValue> value = Get(ident, key);
  const auto* const stored = value.has_value() ? std::get_if<bool>(&*value) : nullptr;
  return stored != nullptr && *stored;
}

int SqliteStorage::GetInteger(const char* ident, const char* key) {
  const std::optional<StoredValue> value = Get(ident, key);
  const auto* const stored = value.has_value() ? std::get_if<int>(&*value) : nullptr;
  return stored == nullptr ? 0 : *stored;
}

int SqliteStorage::Exists(const char* ident, const char* key) {
  return Get(ident, key).has_value() ? 1 : 0;
}

int SqliteStorage::GetStringInto(const char* ident, const char* key, char* buffer, int sizeBytes) {
  const std::optional<StoredValue> value = Get(ident, key);
  const auto* const stored = value.has_value() ? std::get_if<std::string>(&*value) : nullptr;
  if (stored == nullptr || buffer == nullptr || sizeBytes <= 0 ||
      stored->size() >= static_cast<std::size_t>(sizeBytes)) {
    return 0;
  }
  std::memcpy(buffer, stored->c_str(), stored->size() + 1);
  return 1;
}

void SqliteStorage::BeginBatch() {
  const std::lock_guard<std::mutex> lock(memoryMutex_);
  ++batches_[std::this_thread::get_id()].depth;
}

bool SqliteStorage::EndBatch(std::string* error) {
  std::map<StoredKey, VisibleValue> values;
  {
    const std::lock_guard<std::mutex> lock(memoryMutex_);
    const auto batch = batches_.find(std::this_thread::get_id());
    if (batch == batches_.end() || --batch->second.depth > 0) {
      return true;
    }
    values = std::move(batch->second.values);
    batches_.erase(batch);
  }
  return values.empty() || Write(values, error);
}

bool SqliteStorage::Write(const std::map<StoredKey, VisibleValue>& values, std::string* error) {
  {
    const std::lock_guard<std::mutex> fileLock(fileMutex_);
    SqliteFile::Values newer;
    for (const auto& [key, visible] : values) {
      if (visible.number > writtenNumbers_[key]) {
        newer[key] = visible.value;
      }
    }
    if (file_->Store(newer, error)) {
      ForgetWritten(values);
      return true;
    }
  }
  *error += "; the values hold until the program ends";
  if (onFailure_) {
    onFailure_(*error);
  }
  return false;
}

// From now on reads find these values in the file. A value set later stays visible until it is
// written itself.
void SqliteStorage::ForgetWritten(const std::map<StoredKey, VisibleValue>& values) {
  const std::lock_guard<std::mutex> lock(memoryMutex_);
  for (const auto& [key, visible] : values) {
    writtenNumbers_[key] = std::max(writtenNumbers_[key], visible.number);
    const auto found = visible_.find(key);
    if (found != visible_.end() && found->second.number <= visible.number) {
      visible_.erase(found);
    }
  }
}

SqliteFile::Values SqliteStorage::All(const std::string& ident) {
  SqliteFile::Values values;
  {
    const std::lock_guard<std::mutex> lock(fileMutex_);
    values = file_->All(ident);
  }
  const std::lock_guard<std::mutex> lock(memoryMutex_);
  for (const auto& [key, visible] : visible_) {
    if (key.first == ident) {
      values[key] = visible.value;
    }
  }
  return values;
}
