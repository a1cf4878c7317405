// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "interfaces/INamedInterface.h"

// Host service that the module requires to be there and the driver never calls.
class ICDSBuffer : public INamedInterface {};
