// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <chrono>
#include <cstdint>
#include <optional>

// Points in time at equal distances from a first one. They do not drift, however late each is
// noticed. One thread.
class Interval {
 public:
  using Time = std::chrono::steady_clock::time_point;

  // A period of 0 or less has no points at all.
  explicit Interval(std::chrono::milliseconds period) : period_(period) {}

  void Begin(Time first) { next_ = first; }
  bool HasBegun() const { return next_.has_value(); }

  // The next point; nothing before Begin and without a period.
  std::optional<Time> Next() const;

  // True when the next point has come. Then the one behind it is next; points that were missed
  // altogether are left out and counted.
  bool Take(Time now);

  std::uint64_t Missed() const { return missed_; }

 private:
  const std::chrono::milliseconds period_;
  std::optional<Time> next_;
  std::uint64_t missed_ = 0;
};
