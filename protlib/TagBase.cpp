// SPDX-License-Identifier: Apache-2.0
#include "protlib/TagBase.h"

#include <exception>

#include "protlib/ProtUtilsN.h"

TagBase::TagBase(const TagBase& other)
    : ITag(other), conversions_(other.conversions_), errorText_(other.GetErrorText()) {}

int TagBase::PackedLen() const {
  return ProtUtilsN::IsBitType(this) ? ProtUtilsN::GetLenOfBits(GetBitIndex(), GetVarLength())
                                     : GetVarLength();
}

bool TagBase::ConvertVariable(const unsigned char* src, unsigned char* dst, bool toDevice) const {
  return Convert(src, dst, toDevice);
}

bool TagBase::IsReadOnly() const { return false; }

bool TagBase::IsWriteOnly() const { return false; }

void TagBase::SetError(const char* text) const {
  const LeafLock lock(errorMutex_);
  try {
    errorText_ = text;
  } catch (const std::exception&) {
    errorText_ = "Out of memory";  // short enough to need no memory
  }
}

std::string TagBase::GetErrorText() const {
  const LeafLock lock(errorMutex_);
  return errorText_;
}
