// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

// Random numbers that are the same on every machine for the same seed and stream, so that a run of
// a simulator can be repeated. The generator adds an odd constant to its state and mixes the bits
// (splitmix64). One thread.
class SimRandom {
 public:
  // Streams of one seed are independent of each other.
  SimRandom(std::uint64_t seed, std::uint64_t stream);

  std::uint64_t Next();

  // A number from 0 to limit - 1; 0 when the limit is 0.
  std::uint64_t Below(std::uint64_t limit);

  // True with this chance; always at 100 and above, never at 0 and below.
  bool Chance(double percent);

 private:
  std::uint64_t state_;
};
