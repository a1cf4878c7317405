// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "interfaces/IProtocol3.h"

// Fourth version: what the host's read optimiser asks, and grouped writes. Any thread for the
// questions, host threads for the writes.
class IProtocol4 : public IProtocol3 {
 public:
  // slot 43. Largest unused gap in bytes between two tags read together.
  virtual int MaxUnusedGap(const ITag* tag) const = 0;

  // slot 44. Whether `a` starts at a smaller byte offset than `b`.
  virtual bool IsBefore(const ITag* a, const ITag* b) const = 0;

  // slot 45. Whether `b` ends at the bit where `a` begins.
  virtual bool IsAdjacent(const ITag* a, const ITag* b) const = 0;

  // slots 46 to 51. Not supported by this driver.
  virtual bool NeedsReadBeforeWrite(const ITag* tag) const = 0;
  virtual bool CanWriteDatagrams(const ITag* tag) const = 0;
  virtual bool CanAddToWriteDatagram(const ITag* const* tags, int count,
                                     const ITag* candidate) const = 0;
  virtual int WriteDatagramWithStatus(const ITag* const* tags, int count,
                                      const unsigned char* buffer, idal_error_t* status) = 0;
  virtual bool CanWriteBitBlock(const ITag* tag) const = 0;
  virtual int WriteBitBlock(const ITag* tag, const unsigned char* buffer, int bitCount) = 0;
};
