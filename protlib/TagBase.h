// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

#include "interfaces/ITag.h"
#include "protlib/LeafMutex.h"

// The generic half of a tag: its length in the device, its value conversions and its error text.
// What the tag addresses is the derived class's business.
//
// Once built, a tag only changes its error text, which is guarded; every operation may run on any
// thread.
class TagBase : public ITag {
 public:
  TagBase() = default;
  TagBase(const TagBase& other);
  TagBase& operator=(const TagBase&) = delete;
  ~TagBase() override = default;

  int PackedLen() const override;
  bool ConvertVariable(const unsigned char* src, unsigned char* dst, bool toDevice) const override;
  bool IsReadOnly() const override;
  bool IsWriteOnly() const override;

  // Converts through a copy, so that dst is untouched when a conversion fails. Toward the host the
  // conversions run from the last to the first, toward the device from the first to the last:
  // reading undoes what writing did. On failure the error text is "Conversion error at: " and the
  // keyword.
  bool Convert(const unsigned char* src, unsigned char* dst, bool toDevice) const override;

  // Keywords: "swapnibble", "swap2", "swap4", "swap8", "bcd", "neg", "inv".
  bool DoConversion(unsigned char* buffer, const char* conversion, bool toDevice) const override;

  // The reason why the tag is not valid or why its last conversion failed. Never throws.
  void SetError(const char* text) const;
  std::string GetErrorText() const;

 protected:
  // The value conversions in the order in which the URI lists them. Filled while the tag is built.
  std::vector<std::string> conversions_;

 private:
  bool ConvertToHost(const unsigned char* src, unsigned char* dst, unsigned char* work) const;
  bool ConvertToDevice(const unsigned char* src, unsigned char* dst, unsigned char* work) const;
  bool RunConversion(unsigned char* buffer, const std::string& conversion, bool toDevice) const;

  bool SwapGroups(unsigned char* buffer, int groupBytes) const;
  void SwapNibbles(unsigned char* buffer) const;
  bool CodeBcd(unsigned char* buffer, bool toDevice) const;
  bool Negate(unsigned char* buffer) const;
  bool Invert(unsigned char* buffer) const;

  mutable LeafMutex errorMutex_;
  mutable std::string errorText_ LOKA_GUARDED_BY(errorMutex_);
};
