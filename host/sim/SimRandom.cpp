// SPDX-License-Identifier: Apache-2.0
#include "host/sim/SimRandom.h"

namespace {

constexpr std::uint64_t kStep = 0x9E3779B97F4A7C15U;

std::uint64_t Mix(std::uint64_t value) {
  value = (value ^ (value >> 30U)) * 0xBF58476D1CE4E5B9U;
  value = (value ^ (value >> 27U)) * 0x94D049BB133111EBU;
  return value ^ (value >> 31U);
}

}  // namespace

SimRandom::SimRandom(std::uint64_t seed, std::uint64_t stream)
    : state_(Mix(seed + kStep) ^ Mix(stream * kStep + 1)) {}

std::uint64_t SimRandom::Next() {
  state_ += kStep;
  return Mix(state_);
}

// The remainder prefers small numbers by less than one in 2^40 for the limits used here.
std::uint64_t SimRandom::Below(std::uint64_t limit) { return limit == 0 ? 0 : Next() % limit; }

bool SimRandom::Chance(double percent) {
  constexpr std::uint64_t kParts = 1000000;
  return static_cast<double>(Below(kParts)) < percent * (static_cast<double>(kParts) / 100.0);
}
