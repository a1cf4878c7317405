// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include "interfaces/ICU_Type.h"

// One addressable area that a tag can name, with its access rules. A plain value.
class MemoryType {
 public:
  std::string getName() const { return name_; }
  ICU_Type getNaturalType() const { return naturalType_; }
  int getVadoTypes() const { return vadoTypes_; }
  bool isReadOnly() const { return readOnly_; }
  bool isWriteOnly() const { return writeOnly_; }
  int getMaxIndex() const { return maxIndex_; }
  int getBlockReadCount() const { return blockReadCount_; }
  int getBlockWriteCount() const { return blockWriteCount_; }

  // Name as written in a tag URI.
  void setName(const std::string& name) { name_ = name; }
  // Type in which the area is natively held.
  void setNaturalType(ICU_Type type) { naturalType_ = type; }
  // Data types that a tag may use on the area, a mask of type flags.
  void setVadoTypes(int mask) { vadoTypes_ = mask; }
  // Whether values of 2, 4 or 8 bytes are stored swapped.
  void setSwap2(bool value) { swap2_ = value; }
  void setSwap4(bool value) { swap4_ = value; }
  void setSwap8(bool value) { swap8_ = value; }
  // Whether single bits, or arrays of bits, may be written.
  void setBitWrite(bool value) { bitWrite_ = value; }
  void setBitArrayWrite(bool value) { bitArrayWrite_ = value; }
  // Whether writes, or reads, are refused.
  void setReadOnly(bool value) { readOnly_ = value; }
  void setWriteOnly(bool value) { writeOnly_ = value; }
  // Whether the area may be grouped into datagrams.
  void setInDatagram(bool value) { inDatagram_ = value; }
  // Whether the driver converts values itself.
  void setInternalConversion(bool value) { internalConversion_ = value; }
  // Lowest and highest valid index.
  void setMinIndex(int index) { minIndex_ = index; }
  void setMaxIndex(int index) { maxIndex_ = index; }
  // Largest number of items read or written in one block; 0 means one at a time.
  void setBlockReadCount(int count) { blockReadCount_ = count; }
  void setBlockWriteCount(int count) { blockWriteCount_ = count; }
  // Whether values must be read bit by bit.
  void setBitRead(bool value) { bitRead_ = value; }

 private:
  std::string name_;
  ICU_Type naturalType_ = ICU_BOOLEAN;
  int vadoTypes_ = 0x3fffff;  // the first 22 types
  bool swap2_ = false;
  bool swap4_ = false;
  bool swap8_ = false;
  bool bitWrite_ = false;
  bool bitArrayWrite_ = false;
  bool readOnly_ = false;
  bool writeOnly_ = false;
  bool inDatagram_ = false;
  bool internalConversion_ = false;
  int blockReadCount_ = 0;
  int blockWriteCount_ = 0;
  int minIndex_ = 0;
  int maxIndex_ = 0;
  bool bitRead_ = false;
};
