// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "interfaces/IPermanentStorage.h"

// Extended permanent storage. A host that offers it answers IPermanentStorage::ConvertTo with it.
class IPermanentStorage2 : public IPermanentStorage {
 public:
  // slot 12. Copies the stored text with its terminating zero into a buffer of sizeBytes bytes.
  // Non-zero on success, 0 when there is no such text or it does not fit. Host threads.
  virtual int GetStringInto(const char* ident, const char* key, char* buffer, int sizeBytes) = 0;
};
