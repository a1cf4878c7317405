// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <utility>
#include <vector>

#include "protlib/ProtUtilsN.h"
#include "protlib/TagBase.h"

// A tag whose every answer the test sets. Counts the tags that live.
class FakeTag : public TagBase {
 public:
  FakeTag() { ++living_; }
  FakeTag(const FakeTag& other)
      : TagBase(other),
        byteOffset(other.byteOffset),
        bitIndex(other.bitIndex),
        type(other.type),
        length(other.length),
        itemType(other.itemType),
        uri(other.uri),
        hasName(other.hasName) {
    ++living_;
  }
  FakeTag& operator=(const FakeTag&) = delete;
  ~FakeTag() override { --living_; }

  // A tag of a data type as a URI would write it, conversions included.
  explicit FakeTag(const std::string& spec) {
    ++living_;
    std::vector<std::string> conversions;
    if (ProtUtilsN::GetVADOType(spec, type, itemType, length, conversions)) {
      conversions_ = std::move(conversions);
    }
  }

  ITag* Clone() const override { return new FakeTag(*this); }
  unsigned int GetByteOffset() const override { return byteOffset; }
  int GetBitIndex() const override { return bitIndex; }
  const char* GetVarName() const override { return hasName ? uri.c_str() : nullptr; }
  ICU_Type GetVarType() const override { return type; }
  int GetVarLength() const override { return length; }
  ICU_Type GetItemType() const override { return itemType; }

  void SetConversions(std::vector<std::string> conversions) {
    conversions_ = std::move(conversions);
  }
  const std::vector<std::string>& Conversions() const { return conversions_; }

  static int Living() { return living_; }

  unsigned int byteOffset = 0;
  int bitIndex = 0;
  ICU_Type type = ICU_NONE;
  int length = 0;
  ICU_Type itemType = ICU_NONE;
  std::string uri;
  bool hasName = true;

 private:
  static inline int living_ = 0;
};
