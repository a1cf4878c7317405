// SPDX-License-Identifier: Apache-2.0
#pragma once

class Tag_LOKA;

// How one read or write of a tag comes down to items of its memory type: how many, how large the
// buffer is that holds them, and where in it the tag's bytes begin. Lengths are 64 bits wide, so
// that no length that a host passes overflows.
struct BlockAccess {
  // A read of lengthBytes bytes.
  static BlockAccess ForRead(const Tag_LOKA& tag, int lengthBytes);

  // A write of the tag's whole value.
  static BlockAccess ForWrite(const Tag_LOKA& tag);

  // Bytes from one position in the buffer to the next after `count` items from `index` on.
  long long Advance(long long itemIndex, long long count) const;

  bool isBitType = false;
  int itemBytes = 0;    // of the memory type's natural type
  long long index = 0;  // first item
  long long items = 0;  // number of items
  long long skip = 0;   // bytes in front of the tag's own within the first item
  long long bytes = 0;  // length of all items together
};
