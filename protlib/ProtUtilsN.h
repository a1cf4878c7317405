// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <string>
#include <vector>

#include "interfaces/ICU_Type.h"

class ITag;

// The functions of this namespace belong to the library's exported symbols.
#define LOKA_EXPORT __attribute__((visibility("default")))

// Free functions without state that every part of the driver shares: the type catalogue, bit
// copies, and small text helpers. Any thread.
namespace ProtUtilsN {

// One data type of the host. A name that ends in "-" is counted: in a type specification a number
// of items follows it.
struct DataType {
  const char* name;
  ICU_Type type;
  ICU_Type itemType;  // ICU_NONE for scalars
  int length;         // bytes; 0 where the length comes from the count
  unsigned int flag;  // bit of this type in type masks
};

// All data types; the row of a type stands at index code - 1.
extern const std::array<DataType, 27> DataTypes;

// --- types -----------------------------------------------------------------------------------

// Parses a type specification: a type name, for counted types the count directly behind "-", then
// optionally conversions in parentheses, separated by commas. `length` is in bytes (bits, a host
// byte each, for bit arrays) and saturates at 2147483647. The conversions are appended to `params`.
// False, with type, itemType and length untouched, for an unknown name or an unclosed "(".
LOKA_EXPORT bool GetVADOType(const std::string& spec, ICU_Type& type, ICU_Type& itemType,
                             int& length, std::vector<std::string>& params);

// The specification text of a type with a length in bytes; "??" for a code that is no type.
LOKA_EXPORT std::string GetVADOName(ICU_Type type, int length);

// Length of one element in bytes; 0 for counted types and for codes that are no type.
LOKA_EXPORT int GetDataLength(ICU_Type type);

// The type's bit in type masks; 0 for a code that is no type.
LOKA_EXPORT unsigned int GetTypeFlag(ICU_Type type);

// Whether values of the type are single bits.
LOKA_EXPORT bool IsBitType(ICU_Type type);
LOKA_EXPORT bool IsBitType(const ITag* tag);

// Number of items that fit in `length` bytes; 1 for a scalar.
LOKA_EXPORT int GetItemCount(int length, ICU_Type itemType);
LOKA_EXPORT int GetItemCount(const ITag* tag);

// The item type of an array or string, the type itself of a scalar, and its length in bytes.
LOKA_EXPORT ICU_Type GetBasicType(const ITag* tag);
LOKA_EXPORT int GetBasicLength(const ITag* tag);

// Version of this set of functions.
LOKA_EXPORT int GetVersion();

// --- bits ------------------------------------------------------------------------------------
// Bit b of a byte area lies in byte b / 8 under the mask 1 << (b % 8). A count of 0 or less copies
// nothing.

// Number of bytes that the run of bits touches; an empty run still counts one.
LOKA_EXPORT int GetLenOfBits(int startBit, int bitCount);

// Spreads bits of `src` to one byte each, 0 or 1.
LOKA_EXPORT void UnpackBits(unsigned char* dst, const unsigned char* src, int startBit,
                            int bitCount);

// Gathers one byte each into bits of `dst`; the other bits of `dst` keep their values.
LOKA_EXPORT void PackBits(unsigned char* dst, const unsigned char* src, int startBit, int bitCount);

// Copies bits of `src` to the same place within the byte; dst[0] stands for the byte that holds
// startBit.
LOKA_EXPORT void CopyBits(unsigned char* dst, const unsigned char* src, int startBit, int bitCount);

// Copies bits from one position to another.
LOKA_EXPORT void shiftBits(unsigned char* dst, int dstBit, const unsigned char* src, int srcBit,
                           int bitCount);

// First bit of a tag, and the first bit after it, counted from the start of its memory area.
LOKA_EXPORT int getStartingBit(const ITag* tag);
LOKA_EXPORT int getEndingBit(const ITag* tag);

// --- text ------------------------------------------------------------------------------------

// Finds the first "name=" anywhere in `cfg` and stores the letters and digits that follow it.
// False, with `out` untouched, when there is none.
LOKA_EXPORT bool GetConfigValue(const char* cfg, const char* name, std::string& out);

// Removes leading and trailing spaces and tabs.
LOKA_EXPORT void Trim(std::string& s);
LOKA_EXPORT std::string GetTrim(const std::string& s);

// Appends the trimmed pieces between separators to `out`; n separators give n + 1 pieces, empty
// ones included.
LOKA_EXPORT void ParseSubstrings(const std::string& s, std::vector<std::string>& out,
                                 char separator);

}  // namespace ProtUtilsN
