// SPDX-License-Identifier: Apache-2.0
#include "driver/BlockAccess.h"

#include "driver/Tag_LOKA.h"
#include "model/MemoryType.h"
#include "protlib/ProtUtilsN.h"

namespace {

constexpr int kBitsPerByte = 8;

BlockAccess CommonAccess(const Tag_LOKA& tag) {
  BlockAccess access;
  const ICU_Type naturalType = tag.GetMemoryType().getNaturalType();
  access.isBitType = ProtUtilsN::IsBitType(naturalType);
  access.itemBytes = ProtUtilsN::GetDataLength(naturalType);
  access.index = tag.Index();
  return access;
}

void CoverBytes(BlockAccess& access, const Tag_LOKA& tag, int lengthBytes) {
  access.skip = static_cast<long long>(tag.GetByteOffset()) - access.index * access.itemBytes;
  access.items = (access.itemBytes + access.skip + lengthBytes - 1) / access.itemBytes;
  access.bytes = access.items * access.itemBytes;
}

}  // namespace

BlockAccess BlockAccess::ForRead(const Tag_LOKA& tag, int lengthBytes) {
  BlockAccess access = CommonAccess(tag);
  if (access.isBitType) {
    access.items = static_cast<long long>(lengthBytes) * kBitsPerByte;
    access.bytes = lengthBytes;
    access.index = access.index / kBitsPerByte * kBitsPerByte;
  } else {
    CoverBytes(access, tag, lengthBytes);
  }
  return access;
}

BlockAccess BlockAccess::ForWrite(const Tag_LOKA& tag) {
  BlockAccess access = CommonAccess(tag);
  if (access.isBitType) {
    access.items = tag.GetVarLength();
    access.bytes = ProtUtilsN::GetLenOfBits(tag.GetBitIndex(), tag.GetVarLength());
  } else {
    CoverBytes(access, tag, tag.PackedLen());
  }
  return access;
}

long long BlockAccess::Advance(long long itemIndex, long long count) const {
  return isBitType ? (itemIndex % kBitsPerByte + count) / kBitsPerByte : count * itemBytes;
}
