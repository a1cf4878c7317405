// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "interfaces/IProtocol.h"

// Second version: datagrams of several tags.
class IProtocol2 : public IProtocol {
 public:
  // slot 33. Whether `candidate` may join a datagram of `count` tags. Any thread.
  virtual bool CanAddToDatagram(const ITag* const* tags, int count, const ITag* candidate) = 0;

  // slot 34. Reads a datagram and sets status[i] to 1 for each tag. Zero when it failed; the status
  // is then untouched. Host threads.
  virtual int ReadDatagramWithStatus(const ITag* const* tags, int count, unsigned char* buffer,
                                     idal_error_t* status) = 0;
};
