// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "interfaces/INamedInterface.h"

// Host service for network sockets. The module requires it to be there; the driver only prints its
// implementation name and version.
class ISocketFactory : public INamedInterface {};
