// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "interfaces/IProtocol2.h"

// Third version: multiple access, node numbers, bit blocks. This driver answers no to the optional
// ones.
class IProtocol3 : public IProtocol2 {
 public:
  // slots 35 to 38. Host threads.
  virtual bool MultipleReadSupported() const = 0;
  virtual int MultipleRead(IMultiRead* request) = 0;
  virtual bool MultipleWriteSupported() const = 0;
  virtual int MultipleWrite(IMultiWrite* request) = 0;

  // slot 39. The node number that the tag's URI names. Any thread.
  virtual int GetNodeID(const ITag* tag) const = 0;

  // slots 40, 41. Reading a run of bits, count in bits. Host threads.
  virtual bool CanReadBitBlock(const ITag* tag) const = 0;
  virtual int ReadBitBlock(const ITag* tag, unsigned char* buffer, int bitCount) = 0;

  // slot 42. A further interface by name; null here. Any thread.
  virtual void* GetInterface(const char* name) = 0;
};
