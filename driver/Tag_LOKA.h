// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include "driver/MemoryTypeCatalogue.h"
#include "protlib/TagBase.h"

class MemoryType;
class Model;
class Protocol_LOKA;

namespace _LOKA {
struct CommonParams;
struct NodeParams;
}  // namespace _LOKA

// A tag of this driver. Its URI has three fields separated by "?": the node number (may be empty),
// the memory type, and the data type with its conversions, as in 0?rx_token?string-256. The
// constructor checks them; a tag that is not valid carries the reason as its error text.
//
// A valid tag does not change. It refers to records of its protocol and must not outlive it.
class Tag_LOKA : public TagBase {
 public:
  // May throw std::bad_alloc. A null URI counts as an empty one.
  Tag_LOKA(const char* uri, const Protocol_LOKA& protocol);
  Tag_LOKA(const Tag_LOKA&) = default;
  Tag_LOKA& operator=(const Tag_LOKA&) = delete;
  ~Tag_LOKA() override = default;

  ITag* Clone() const override;
  unsigned int GetByteOffset() const override;
  int GetBitIndex() const override;
  const char* GetVarName() const override { return uri_.c_str(); }
  ICU_Type GetVarType() const override { return varType_; }
  int GetVarLength() const override { return varLength_; }
  ICU_Type GetItemType() const override { return itemType_; }
  bool IsReadOnly() const override;
  bool IsWriteOnly() const override;

  bool IsValid() const { return valid_; }
  int NodeId() const { return nodeId_; }
  int Index() const { return index_; }

  // Only of a valid tag.
  const MemoryType& GetMemoryType() const { return *memoryType_; }
  MemoryTypeId Id() const { return id_; }
  bool IsSerialParam() const { return isSerialParam_; }

 protected:
  // Where the tag lies in its memory area. A URI names neither, so both are 0; the arithmetic of
  // reads and writes serves other places all the same.
  int index_ = 0;     // element
  int subIndex_ = 0;  // item or bit within the element

  // What the tag names and how it is seen. No URI leads to combinations that contradict each other;
  // reads and writes answer them all the same.
  ICU_Type varType_ = ICU_NONE;
  MemoryTypeId id_ = MemoryTypeId::kTxToken;
  bool isSerialParam_ = false;

 private:
  bool parseTagUrl(const Protocol_LOKA& protocol);
  bool FindMemory(const Protocol_LOKA& protocol, const std::string& memoryType);
  bool CheckDataType(const std::string& dataType);
  bool Fail(const char* text) const;

  bool valid_ = false;
  std::string uri_;
  int nodeId_ = 0;
  int varLength_ = 0;
  ICU_Type itemType_ = ICU_NONE;
  const MemoryType* memoryType_ = nullptr;
  const _LOKA::NodeParams* nodeParams_ = nullptr;
  const _LOKA::CommonParams* commonParams_ = nullptr;
  const Model* model_ = nullptr;
};
