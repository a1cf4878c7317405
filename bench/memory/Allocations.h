// SPDX-License-Identifier: Apache-2.0
#pragma once

// Allocations of the process so far (operator new).
long long AllocationCount();
