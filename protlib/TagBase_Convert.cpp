// SPDX-License-Identifier: Apache-2.0
#include <algorithm>
#include <array>
#include <cstdint>
#include <cstring>

#include "protlib/NoThrow.h"
#include "protlib/ProtUtilsN.h"
#include "protlib/TagBase.h"
#include "protlib/WorkBuffer.h"

namespace {

constexpr int kLongestBcdItemBytes = 4;

// Values of 1 to 4 bytes, little-endian, as the device sees them.
std::uint32_t LoadLittleEndian(const unsigned char* bytes, int lengthBytes) {
  std::uint32_t value = 0;
  for (int i = lengthBytes - 1; i >= 0; --i) {
    value = value << 8U | bytes[i];
  }
  return value;
}

void StoreLittleEndian(unsigned char* bytes, int lengthBytes, std::uint32_t value) {
  for (int i = 0; i < lengthBytes; ++i) {
    bytes[i] = static_cast<unsigned char>(value);
    value >>= 8U;
  }
}

// One digit per four bits, units lowest. False when the value has more digits than fit.
bool EncodeBcd(unsigned char* item, int lengthBytes) {
  std::uint32_t rest = LoadLittleEndian(item, lengthBytes);
  std::uint32_t coded = 0;
  for (int digit = 0; digit < 2 * lengthBytes; ++digit) {
    coded |= (rest % 10U) << static_cast<unsigned int>(4 * digit);
    rest /= 10U;
  }
  StoreLittleEndian(item, lengthBytes, coded);
  return rest == 0;
}

// False when a half byte is no decimal digit.
bool DecodeBcd(unsigned char* item, int lengthBytes) {
  std::uint32_t value = 0;
  for (int i = lengthBytes - 1; i >= 0; --i) {
    const std::uint32_t high = item[i] / 16U;
    const std::uint32_t low = item[i] % 16U;
    if (high > 9 || low > 9) {
      return false;
    }
    value = value * 100 + high * 10 + low;
  }
  StoreLittleEndian(item, lengthBytes, value);
  return true;
}

// Two's complement of a little-endian integer; the most negative value stays what it is.
void NegateInteger(unsigned char* item, int lengthBytes) {
  unsigned int carry = 1;
  for (int i = 0; i < lengthBytes; ++i) {
    const unsigned int sum = static_cast<unsigned char>(~item[i]) + carry;
    item[i] = static_cast<unsigned char>(sum);
    carry = sum >> 8U;
  }
}

// Flips the sign bit of an IEEE 754 number.
void NegateFloat(unsigned char* item, int lengthBytes) { item[lengthBytes - 1] ^= 0x80U; }

}  // namespace

bool TagBase::Convert(const unsigned char* src, unsigned char* dst, bool toDevice) const {
  if (src == nullptr || dst == nullptr || GetVarLength() < 0) {
    return false;
  }
  constexpr std::size_t kWorkBytes = 256;
  const int length = GetVarLength();
  if (length <= static_cast<int>(kWorkBytes) && conversions_.empty() &&
      !ProtUtilsN::IsBitType(GetVarType()) && PackedLen() == length) {
    // Both forms are the same and need no memory, so that nothing can fail half-way.
    std::memmove(dst, src, static_cast<std::size_t>(length));
    return true;
  }
  return NoThrow(false, [&] {
    WorkBuffer<kWorkBytes> work(std::max(length, PackedLen()));
    if (!work.IsValid()) {
      return false;
    }
    return toDevice ? ConvertToDevice(src, dst, work.Data()) : ConvertToHost(src, dst, work.Data());
  });
}

bool TagBase::ConvertToHost(const unsigned char* src, unsigned char* dst,
                            unsigned char* work) const {
  const int length = GetVarLength();
  if (ProtUtilsN::IsBitType(this)) {
    ProtUtilsN::UnpackBits(work, src, GetBitIndex(), length);
  } else {
    std::memcpy(work, src, static_cast<std::size_t>(PackedLen()));
  }
  for (auto conversion = conversions_.rbegin(); conversion != conversions_.rend(); ++conversion) {
    if (!RunConversion(work, *conversion, false)) {
      return false;
    }
  }
  std::memcpy(dst, work, static_cast<std::size_t>(length));
  return true;
}

bool TagBase::ConvertToDevice(const unsigned char* src, unsigned char* dst,
                              unsigned char* work) const {
  const int length = GetVarLength();
  std::memcpy(work, src, static_cast<std::size_t>(length));
  for (const std::string& conversion : conversions_) {
    if (!RunConversion(work, conversion, true)) {
      return false;
    }
  }
  if (ProtUtilsN::IsBitType(this)) {
    ProtUtilsN::PackBits(dst, work, GetBitIndex(), length);
  } else {
    std::memcpy(dst, work, static_cast<std::size_t>(PackedLen()));
  }
  return true;
}

bool TagBase::RunConversion(unsigned char* buffer, const std::string& conversion,
                            bool toDevice) const {
  if (DoConversion(buffer, conversion.c_str(), toDevice)) {
    return true;
  }
  SetError(("Conversion error at: " + conversion).c_str());
  return false;
}

bool TagBase::DoConversion(unsigned char* buffer, const char* conversion, bool toDevice) const {
  if (buffer == nullptr || conversion == nullptr || GetVarLength() < 0) {
    return false;
  }
  const auto is = [conversion](const char* keyword) {
    return std::strcmp(conversion, keyword) == 0;
  };
  if (is("swapnibble")) {
    SwapNibbles(buffer);
    return true;
  }
  if (is("swap2")) {
    return SwapGroups(buffer, 2);
  }
  if (is("swap4")) {
    return SwapGroups(buffer, 4);
  }
  if (is("swap8")) {
    return SwapGroups(buffer, 8);
  }
  if (is("bcd")) {
    return CodeBcd(buffer, toDevice);
  }
  if (is("neg")) {
    return Negate(buffer);
  }
  return is("inv") && Invert(buffer);
}

void TagBase::SwapNibbles(unsigned char* buffer) const {
  for (int i = 0; i < GetVarLength(); ++i) {
    buffer[i] = static_cast<unsigned char>(buffer[i] << 4U | buffer[i] >> 4U);
  }
}

bool TagBase::SwapGroups(unsigned char* buffer, int groupBytes) const {
  const int length = GetVarLength();
  if (length % groupBytes != 0) {
    return false;
  }
  for (int i = 0; i < length; i += groupBytes) {
    std::reverse(buffer + i, buffer + i + groupBytes);
  }
  return true;
}

bool TagBase::CodeBcd(unsigned char* buffer, bool toDevice) const {
  const int itemBytes = ProtUtilsN::GetBasicLength(this);
  if (itemBytes < 1 || itemBytes > kLongestBcdItemBytes) {
    return false;
  }
  const int itemCount = GetVarLength() / itemBytes;
  for (int i = 0; i < itemCount; ++i) {
    unsigned char* item = buffer + static_cast<std::ptrdiff_t>(i) * itemBytes;
    if (!(toDevice ? EncodeBcd(item, itemBytes) : DecodeBcd(item, itemBytes))) {
      return false;
    }
  }
  return true;
}

bool TagBase::Negate(unsigned char* buffer) const {
  const ICU_Type type = ProtUtilsN::GetBasicType(this);
  const bool isFloat = type == ICU_FLOAT || type == ICU_DOUBLE;
  if (!isFloat && type != ICU_BYTE && type != ICU_SHORT && type != ICU_INT && type != ICU_INT64) {
    return false;
  }
  const int itemBytes = ProtUtilsN::GetDataLength(type);
  const int itemCount = ProtUtilsN::GetItemCount(this);
  // Steps in bytes up to the number of items: of an array of wide items only the first ones are
  // negated. Panels rely on it.
  for (int offset = 0; offset < itemCount && offset <= GetVarLength() - itemBytes;
       offset += itemBytes) {
    if (isFloat) {
      NegateFloat(buffer + offset, itemBytes);
    } else {
      NegateInteger(buffer + offset, itemBytes);
    }
  }
  return true;
}

bool TagBase::Invert(unsigned char* buffer) const {
  const int length = GetVarLength();
  if (ProtUtilsN::IsBitType(this)) {
    std::transform(buffer, buffer + length, buffer,
                   [](unsigned char bit) { return static_cast<unsigned char>(bit == 0 ? 1 : 0); });
    return true;
  }
  constexpr std::array<ICU_Type, 5> kInvertible = {ICU_UNSIGNED_BYTE, ICU_UNSIGNED_SHORT,
                                                   ICU_UNSIGNED_INT, ICU_BINARY, ICU_UINT64};
  if (std::find(kInvertible.begin(), kInvertible.end(), ProtUtilsN::GetBasicType(this)) ==
      kInvertible.end()) {
    return false;
  }
  std::transform(buffer, buffer + length, buffer,
                 [](unsigned char byte) { return static_cast<unsigned char>(~byte); });
  return true;
}
