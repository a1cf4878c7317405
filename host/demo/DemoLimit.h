// SPDX-License-Identifier: Apache-2.0
#pragma once

// Ends, in ms, a wait of the demonstration for something that comes at once.
inline constexpr int kDemoLimitMs = 20000;
