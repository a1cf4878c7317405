// SPDX-License-Identifier: Apache-2.0
#include "interfaces/ITag.h"
#include "protlib/ProtUtilsN.h"

namespace ProtUtilsN {

namespace {

bool GetBit(const unsigned char* area, int bit) {
  return (area[bit / 8] & (1U << static_cast<unsigned int>(bit % 8))) != 0;
}

void SetBit(unsigned char* area, int bit, bool value) {
  const auto mask = static_cast<unsigned char>(1U << static_cast<unsigned int>(bit % 8));
  const unsigned char byte = area[bit / 8];
  area[bit / 8] = static_cast<unsigned char>(value ? byte | mask : byte & ~mask);
}

}  // namespace

int GetLenOfBits(int startBit, int bitCount) {
  const long long lastBit = static_cast<long long>(startBit) + bitCount - 1;
  return static_cast<int>(lastBit / 8 - startBit / 8 + 1);
}

void UnpackBits(unsigned char* dst, const unsigned char* src, int startBit, int bitCount) {
  for (int i = 0; i < bitCount; ++i) {
    dst[i] = GetBit(src, startBit + i) ? 1 : 0;
  }
}

void PackBits(unsigned char* dst, const unsigned char* src, int startBit, int bitCount) {
  for (int i = 0; i < bitCount; ++i) {
    SetBit(dst, startBit + i, src[i] != 0);
  }
}

void CopyBits(unsigned char* dst, const unsigned char* src, int startBit, int bitCount) {
  shiftBits(dst, startBit % 8, src, startBit, bitCount);
}

void shiftBits(unsigned char* dst, int dstBit, const unsigned char* src, int srcBit, int bitCount) {
  for (int i = 0; i < bitCount; ++i) {
    SetBit(dst, dstBit + i, GetBit(src, srcBit + i));
  }
}

int getStartingBit(const ITag* tag) {
  // Unsigned, so that a huge offset wraps instead of overflowing.
  unsigned int bit = tag->GetByteOffset() * 8U;
  if (IsBitType(tag)) {
    bit += static_cast<unsigned int>(tag->GetBitIndex());
  }
  return static_cast<int>(bit);
}

int getEndingBit(const ITag* tag) {
  const unsigned int bits = IsBitType(tag) ? static_cast<unsigned int>(tag->GetVarLength())
                                           : static_cast<unsigned int>(tag->PackedLen()) * 8U;
  return static_cast<int>(static_cast<unsigned int>(getStartingBit(tag)) + bits);
}

}  // namespace ProtUtilsN
