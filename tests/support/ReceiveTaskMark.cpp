// SPDX-License-Identifier: Apache-2.0
#include "tests/support/ReceiveTaskMark.h"

namespace {
thread_local bool isReceiveTask = false;
}  // namespace

ReceiveTaskMark::ReceiveTaskMark(bool value) : former_(isReceiveTask) { isReceiveTask = value; }

ReceiveTaskMark::~ReceiveTaskMark() { isReceiveTask = former_; }

bool ReceiveTaskMark::IsSet() { return isReceiveTask; }
