// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "interfaces/INamedInterface.h"

// Optional host service: typed values that survive a restart, addressed by a key space (the
// protocol's identifier) and a key. IInterface::ConvertTo is the query for IPermanentStorage2.
// All operations: host threads, several at a time.
class IPermanentStorage : public INamedInterface {
 public:
  // slots 5 to 7. Store a value, replacing the key's former value of whatever type.
  virtual void SetString(const char* ident, const char* key, const char* text) = 0;
  virtual void SetBoolean(const char* ident, const char* key, bool value) = 0;
  virtual void SetInteger(const char* ident, const char* key, int value) = 0;

  // slot 8. The stored text, owned by the storage and valid until its next operation. May be null.
  virtual const char* GetString(const char* ident, const char* key) = 0;

  // slots 9, 10. The stored value; false and 0 when there is none.
  virtual bool GetBoolean(const char* ident, const char* key) = 0;
  virtual int GetInteger(const char* ident, const char* key) = 0;

  // slot 11. Non-zero when the key is stored.
  virtual int Exists(const char* ident, const char* key) = 0;
};
