// SPDX-License-Identifier: Apache-2.0
#include "tests/support/HostCall.h"

namespace {
thread_local bool isInside = false;
}  // namespace

HostCall::HostCall() : former_(isInside) { isInside = true; }

HostCall::~HostCall() { isInside = former_; }

bool HostCall::IsInside() { return isInside; }
