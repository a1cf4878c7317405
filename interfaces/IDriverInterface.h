// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "interfaces/INamedInterface.h"

// Optional host service. Obtained when present, never called.
class IDriverInterface : public INamedInterface {};
