// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "interfaces/INamedInterface.h"

// Optional host service for diagnostics. Obtained when present, never called.
class IDiag : public INamedInterface {};
