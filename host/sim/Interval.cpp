// SPDX-License-Identifier: Apache-2.0
#include "host/sim/Interval.h"

std::optional<Interval::Time> Interval::Next() const {
  return period_.count() > 0 ? next_ : std::nullopt;
}

bool Interval::Take(Time now) {
  if (period_.count() <= 0 || !next_ || now < *next_) {
    return false;
  }
  const auto passed = (now - *next_) / period_;
  missed_ += static_cast<std::uint64_t>(passed);
  *next_ += period_ * (passed + 1);
  return true;
}
