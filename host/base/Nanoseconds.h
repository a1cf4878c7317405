// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

inline constexpr std::int64_t kNsPerUs = 1'000;
inline constexpr std::int64_t kNsPerMs = 1'000'000;
