// SPDX-License-Identifier: Apache-2.0
#include "protlib/ProtocolBase.h"

int ProtocolBase::GetInfo(char* /*buffer*/, int /*sizeBytes*/) const { return 0; }

bool ProtocolBase::DoCommand(const char* /*command*/, char* /*reply*/, int /*sizeBytes*/) {
  return false;
}
