// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <condition_variable>
#include <functional>
#include <mutex>
#include <string>
#include <thread>

#include "host/port/EventSignal.h"

// Reads what is typed or piped in on a thread of its own, so that the thread that serves the
// instance never waits for it. One thread takes.
class KeyInput {
 public:
  // `onInput` is called on the reading thread when there is something to take. The descriptor stays
  // open.
  KeyInput(int fileDescriptor, std::function<void()> onInput);
  ~KeyInput();

  KeyInput(const KeyInput&) = delete;
  KeyInput& operator=(const KeyInput&) = delete;

  // There is a byte to take, or a line, or the end was reached.
  bool HasByte() const;
  bool HasLine() const;

  // All bytes were taken and there will be no more.
  bool IsAtEnd() const;

  // The next byte; false when there is none yet.
  bool TakeByte(char* byte);

  // The next line without its end, LF or CR LF; the rest of the input counts as a line, too. False
  // when there is none yet. A line of kMaxLineBytes is taken without waiting for its end.
  static constexpr std::size_t kMaxLineBytes = std::size_t{256} * 1024;
  bool TakeLine(std::string* line);

 private:
  void Run();
  bool Read(std::string* bytes) const;
  std::size_t FindLineEnd() const;

  const int fileDescriptor_;
  const std::function<void()> onInput_;
  const EventSignal end_;

  mutable std::mutex mutex_;
  std::condition_variable hasRoom_;
  std::string bytes_;  // from next_ on not taken
  std::size_t next_ = 0;
  mutable std::size_t searched_ = 0;  // no line end in front of it
  bool isOver_ = false;
  bool isEnding_ = false;

  std::thread thread_;  // the last member: it uses all others
};
