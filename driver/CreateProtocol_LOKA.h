// SPDX-License-Identifier: Apache-2.0
#pragma once

class IProtocol;

// A new protocol object, owned by the caller. Throws std::bad_alloc.
IProtocol* CreateProtocol_LOKA();
