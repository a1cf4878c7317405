// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "interfaces/IProtocol5.h"

// Sixth version: time stamps and the fields of a tag URI. A time stamp counts milliseconds since
// 1970-01-01 00:00 UTC and is taken once, after the read succeeded; a failed read leaves it as it
// was.
class IProtocol6 : public IProtocol5 {
 public:
  // slot 71. Any thread.
  virtual bool hasPlcTimestamp(const ITag* tag) = 0;

  // slots 72 to 74. Read, ReadBlock and ReadDatagramWithStatus with a time stamp (one a tag for the
  // datagram). Host threads.
  virtual int readWithTimestamp(const ITag* tag, unsigned char* value,
                                unsigned long long* timestampMs) = 0;
  virtual int readBlockWithTimestamp(const ITag* tag, unsigned char* buffer, int lengthBytes,
                                     unsigned long long* timestampMs) = 0;
  virtual int readDatagramWithTimestamp(const ITag* const* tags, int count, unsigned char* buffer,
                                        idal_error_t* status, unsigned long long* timestampsMs) = 0;

  // slot 75. Number of fields of a tag URI. Any thread.
  virtual int getTagUriFieldCount() const = 0;

  // slot 76. Name of a field; null for an index outside 0 to count - 1. Any thread.
  virtual const char* getTagUriFieldName(int index) const = 0;

  // slot 77. Index of the field of that exact name, -1 for none. Any thread.
  virtual int getTagUriFieldPosition(const char* name) const = 0;

  // slot 78. Start of a field within the tag's own URI text (not terminated), its length in
  // characters through `length`; null, and `length` untouched, when there is no such field. Any
  // thread.
  virtual const char* getTagUriField(const ITag* tag, int index, int* length) const = 0;
};
