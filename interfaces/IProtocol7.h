// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "interfaces/IProtocol6.h"

// Seventh version: single items of an array tag. Host threads.
class IProtocol7 : public IProtocol6 {
 public:
  // slot 79. Reads the whole array and copies one item out. Non-zero on success.
  virtual int readArrayItem(const ITag* tag, int index, unsigned char* item) = 0;

  // slot 80. Reads the whole array, replaces one item, writes the whole array back. Non-zero on
  // success.
  virtual int writeArrayItem(const ITag* tag, int index, const unsigned char* item) = 0;

  // slot 81. ReadBitBlock with a time stamp.
  virtual int readBitBlockWithTimestamp(const ITag* tag, unsigned char* buffer, int bitCount,
                                        unsigned long long* timestampMs) = 0;
};
