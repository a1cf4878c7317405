// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "interfaces/ITaskRunner.h"

namespace MultiTaskN {

// Base of everything that a host task of ours runs.
class TaskRunner : public ITaskRunner {};

}  // namespace MultiTaskN
