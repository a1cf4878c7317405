// SPDX-License-Identifier: Apache-2.0
#include "host/port/EchoFilter.h"

#include <algorithm>

void EchoFilter::Expect(std::string_view bytes, std::int64_t nowNs, std::int64_t lineTimeNs) {
  const std::lock_guard<std::mutex> lock(mutex_);
  lineFreeNs_ = std::max(lineFreeNs_, nowNs) + lineTimeNs;
  for (const char byte : bytes) {
    expected_.push_back({static_cast<unsigned char>(byte), lineFreeNs_ + kGraceNs});
  }
}

void EchoFilter::Withdraw(std::size_t count) {
  const std::lock_guard<std::mutex> lock(mutex_);
  expected_.erase(expected_.end() - static_cast<std::ptrdiff_t>(std::min(count, expected_.size())),
                  expected_.end());
}

EchoFilter::Outcome EchoFilter::Filter(std::string* bytes, std::int64_t nowNs,
                                       std::size_t* removedBytes) {
  const std::lock_guard<std::mutex> lock(mutex_);
  *removedBytes = 0;
  if (!expected_.empty() && nowNs > expected_.front().untilNs) {
    expected_.clear();
    return Outcome::kNoEcho;
  }
  std::size_t matching = 0;
  while (matching < bytes->size() && !expected_.empty() &&
         static_cast<unsigned char>((*bytes)[matching]) == expected_.front().byte) {
    expected_.pop_front();
    ++matching;
  }
  *removedBytes = matching;
  bytes->erase(0, matching);
  if (bytes->empty() || expected_.empty()) {
    return Outcome::kAsExpected;
  }
  expected_.clear();
  return Outcome::kMismatch;
}

void EchoFilter::Clear() {
  const std::lock_guard<std::mutex> lock(mutex_);
  expected_.clear();
}
