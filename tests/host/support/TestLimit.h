// SPDX-License-Identifier: Apache-2.0
#pragma once

// Ends, in ms, a wait for something that always comes; only a test that fails waits so long.
inline constexpr int kLimitMs = 20000;
