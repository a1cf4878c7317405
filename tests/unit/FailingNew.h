// SPDX-License-Identifier: Apache-2.0
#pragma once

// Lets allocations of the calling thread fail while the object lives: the nth one from now (counted
// from 1), or the nth and all that follow. Every allocation of the program counts, those of a
// library that it has loaded included, but not those of a scripted host; so a test keeps its own
// out of the object's life.
class FailingNew {
 public:
  enum class Mode { kOnce, kFromThenOn };

  explicit FailingNew(int nth, Mode mode = Mode::kOnce);
  ~FailingNew();
  FailingNew(const FailingNew&) = delete;
  FailingNew& operator=(const FailingNew&) = delete;

  // Whether an allocation has failed. A loop over n ends when none has.
  bool HasFailed() const;

  // Number of allocations of the calling thread so far.
  static long long Count();

  // Number of allocations of all threads, the host's included, that have not been freed.
  static long long Living();
};
