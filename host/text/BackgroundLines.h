// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <cstdint>
#include <mutex>
#include <string>
#include <thread>

#include "host/port/EventSignal.h"

// Lines for somebody who may not read them: whoever writes never waits. What waits is bounded;
// lines beyond that are left out, and how many is told as soon as there is room again. Any thread.
class BackgroundLines {
 public:
  static constexpr std::size_t kMaxWaitingBytes = std::size_t{1024} * 1024;

  // The descriptor stays open.
  explicit BackgroundLines(int fileDescriptor);

  // Writes what waits, as long as somebody reads it; gives up after 200 ms without that.
  ~BackgroundLines();

  BackgroundLines(const BackgroundLines&) = delete;
  BackgroundLines& operator=(const BackgroundLines&) = delete;

  // The line without its end.
  void Write(const std::string& line);

 private:
  void Run();
  std::string Take();
  bool AwaitReader() const;
  void Put(const std::string& bytes) const;
  bool IsEnding() const;

  const int fileDescriptor_;
  const EventSignal wake_;    // there is something to write
  const EventSignal ending_;  // stays raised
  mutable std::mutex mutex_;
  std::string waiting_;
  std::uint64_t leftOut_ = 0;
  bool isEnding_ = false;
  std::thread thread_;  // the last member: it uses all others
};
