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
  FakeTag() = default;
  FakeTag(const FakeTag& other) = default;
  FakeTag& operator=(const FakeTag&) = delete;
  ~FakeTag() override = default;

  // A tag of a data type as a URI would write it, conversions included.
  explicit FakeTag(const std::string& spec) {
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

  static int Living() { return Life::count; }

  unsigned int byteOffset = 0;
  int bitIndex = 0;
  ICU_Type type = ICU_NONE;
  int length = 0;
  ICU_Type itemType = ICU_NONE;
  std::string uri;
  bool hasName = true;

 private:
  // Counts also when the constructor of the tag itself is left by an exception.
  struct Life {
    Life() { ++count; }
    Life(const Life& /*other*/) { ++count; }
    Life& operator=(const Life&) = delete;
    ~Life() { --count; }
    static inline int count = 0;
  };
  Life life_;
};
