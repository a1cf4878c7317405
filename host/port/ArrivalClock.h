// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

// Decides by arrival times what a receiver that asks byte by byte with a time-out T is answered:
// the next byte or "time-out". When threads happened to run plays no part, so a busy machine
// neither splits nor joins what silences separate. All times are nanoseconds of one monotonic
// clock.
//
// The rule. Silence is counted from the arrival of the last byte that was given.
//   * The next byte is given when it arrived within T of that; else the answer is "time-out", once,
//     and then the byte, however long the silence was. So a receiver that was away for long, with
//     bytes and silences piling up meanwhile, hears one time-out in each silence of more than T and
//     catches up without waiting.
//   * With nothing there the answer is "time-out" as soon as T has passed and the line was looked
//     at after that moment. Each further time-out takes T of its own, counted from the end of the
//     one before; a receiver that stayed away meanwhile starts a fresh T.
//   * Before the first byte there is no silence to count: the first T starts with the first call.
//
// One thread.
class ArrivalClock {
 public:
  // Whether a byte that arrived at that time is given to a receiver whose time-out is timeoutNs;
  // when not, "time-out" is the answer (see TimedOut).
  bool IsInTime(std::int64_t arrivedNs, std::int64_t timeoutNs) const {
    return isSilent_ || arrivedNs - startNs_ <= timeoutNs;
  }

  // With nothing there at nowNs: when "time-out" becomes the answer. May lie in the past.
  std::int64_t DeadlineNs(std::int64_t nowNs, std::int64_t timeoutNs);

  // A byte was given; with a block, its last byte.
  void Gave(std::int64_t arrivedNs);

  // "Time-out" was answered for a silence that was over at endNs.
  void TimedOut(std::int64_t endNs);

  // When a byte arrived that the receiver itself found at foundNs, after its deadline, while the
  // thread that should have stamped it had not been there yet. That thread is late, so the byte may
  // have come in time: it counts as in time when the delay is at most half the time-out.
  static std::int64_t BelatedArrivalNs(std::int64_t foundNs, std::int64_t deadlineNs,
                                       std::int64_t timeoutNs);

 private:
  std::int64_t startNs_ = 0;
  bool isSilent_ = true;  // the last answer was "time-out", or there was none
  bool hasStarted_ = false;
};
