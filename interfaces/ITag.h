// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "interfaces/ICU_Type.h"

// One tag: an address in the driver with the data type of its value. Implemented by the plug-in,
// created with IProtocol::CreateTag, owned by its protocol. A valid tag does not change, so every
// operation but DoConversion and the conversions may be called on any thread at any time.
class ITag {
 public:
  // slots 0, 1
  virtual ~ITag() = default;

  // slot 2. A copy, owned by the caller (the protocol does not know it). Null when memory is short.
  virtual ITag* Clone() const = 0;

  // slot 3. Offset in bytes of the tag's data in its memory area.
  virtual unsigned int GetByteOffset() const = 0;

  // slot 4. Bit index within the first byte, for bit types.
  virtual int GetBitIndex() const = 0;

  // slot 5. The tag's name, which is its URI. Owned by the tag.
  virtual const char* GetVarName() const = 0;

  // slot 6. Data type of the host value.
  virtual ICU_Type GetVarType() const = 0;

  // slot 7. Length of the host value: bytes, or bits for a bit type (a host byte each).
  virtual int GetVarLength() const = 0;

  // slot 8. Item type of an array or string, ICU_NONE for a scalar.
  virtual ICU_Type GetItemType() const = 0;

  // slot 9. Length of the device image in bytes.
  virtual int PackedLen() const = 0;

  // slot 10. Same as Convert.
  virtual bool ConvertVariable(const unsigned char* src, unsigned char* dst,
                               bool toDevice) const = 0;

  // slots 11, 12. Access rights of the tag's memory type.
  virtual bool IsReadOnly() const = 0;
  virtual bool IsWriteOnly() const = 0;

  // slot 13. Converts a value between the device image (PackedLen bytes) and the host value
  // (GetVarLength bytes) by the tag's conversions. toDevice says the direction. False when a
  // conversion is not possible; dst is then untouched.
  virtual bool Convert(const unsigned char* src, unsigned char* dst, bool toDevice) const = 0;

  // slot 14. Applies one named conversion in place to GetVarLength bytes. False when it is not
  // possible; the buffer may then be changed.
  virtual bool DoConversion(unsigned char* buffer, const char* conversion, bool toDevice) const = 0;
};
