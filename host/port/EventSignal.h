// SPDX-License-Identifier: Apache-2.0
#pragma once

// A sign that a thread waiting in poll(2) can see (eventfd(2)). Any thread.
class EventSignal {
 public:
  // Throws std::system_error when the system has no descriptor left.
  EventSignal();
  ~EventSignal();

  EventSignal(const EventSignal&) = delete;
  EventSignal& operator=(const EventSignal&) = delete;

  // Readable from Raise until Clear.
  int FileDescriptor() const { return fileDescriptor_; }

  void Raise() const;
  void Clear() const;

 private:
  const int fileDescriptor_;
};
