// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <cstdint>
#include <deque>
#include <mutex>
#include <string>
#include <string_view>

// Takes the own bytes out of what a two-wire line brings back: exactly those that were sent, in
// order, and nothing else. Something else in their place means that two have sent at once; it is
// counted and from there on everything is data. An echo that stays away is waited for no longer
// than the line needs and kGraceNs. Any thread.
class EchoFilter {
 public:
  // Adapters hand on what they receive in lumps of up to 16 ms; the rest is for a busy machine.
  static constexpr std::int64_t kGraceNs = 250'000'000;

  enum class Outcome {
    kAsExpected,
    kMismatch,  // something else came
    kNoEcho,    // nothing came in time
  };

  // These bytes are about to go out; the line needs lineTimeNs for them. Before they are written.
  void Expect(std::string_view bytes, std::int64_t nowNs, std::int64_t lineTimeNs);

  // The last `count` of the bytes expected were not taken by the line.
  void Withdraw(std::size_t count);

  // Removes the echo from what was received at nowNs and counts what was removed.
  Outcome Filter(std::string* bytes, std::int64_t nowNs, std::size_t* removedBytes);

  // Nothing is expected any more.
  void Clear();

 private:
  struct Expected {
    unsigned char byte;
    std::int64_t untilNs;
  };

  std::mutex mutex_;
  std::deque<Expected> expected_;
  std::int64_t lineFreeNs_ = 0;  // when everything expected so far has left
};
