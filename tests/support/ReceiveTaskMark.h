// SPDX-License-Identifier: Apache-2.0
#pragma once

// Marks the calling thread as the receive task (or not) for as long as the object lives, so that
// the scripted semaphores know which rules hold for it.
class ReceiveTaskMark {
 public:
  explicit ReceiveTaskMark(bool isReceiveTask);
  ~ReceiveTaskMark();
  ReceiveTaskMark(const ReceiveTaskMark&) = delete;
  ReceiveTaskMark& operator=(const ReceiveTaskMark&) = delete;

  static bool IsSet();

 private:
  const bool former_;
};
