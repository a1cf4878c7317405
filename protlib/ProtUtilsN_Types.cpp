// SPDX-License-Identifier: Apache-2.0
#include <algorithm>
#include <limits>

#include "interfaces/ITag.h"
#include "protlib/ProtUtilsN.h"

namespace ProtUtilsN {

namespace {

constexpr unsigned int FlagOf(ICU_Type type) { return 1U << static_cast<unsigned int>(type - 1); }

constexpr DataType Scalar(const char* name, ICU_Type type, int length) {
  return {name, type, ICU_NONE, length, FlagOf(type)};
}

constexpr DataType Counted(const char* name, ICU_Type type, ICU_Type itemType) {
  return {name, type, itemType, 0, FlagOf(type)};
}

const DataType* FindRow(ICU_Type type) {
  if (type < ICU_BOOLEAN || type > ICU_OBJECT) {
    return nullptr;
  }
  return &DataTypes[static_cast<std::size_t>(type) - 1];
}

int Saturate(long long value) {
  return static_cast<int>(std::min<long long>(value, std::numeric_limits<int>::max()));
}

// The digits at the start of `text` as a number.
int LeadingNumber(const std::string& text) {
  long long number = 0;
  for (const char c : text) {
    if (c < '0' || c > '9') {
      break;
    }
    number = Saturate(number * 10 + (c - '0'));
  }
  return static_cast<int>(number);
}

}  // namespace

const std::array<DataType, 27> DataTypes = {{
    Scalar("boolean", ICU_BOOLEAN, 1),
    Scalar("byte", ICU_BYTE, 1),
    Scalar("short", ICU_SHORT, 2),
    Scalar("int", ICU_INT, 4),
    Scalar("unsignedByte", ICU_UNSIGNED_BYTE, 1),
    Scalar("unsignedShort", ICU_UNSIGNED_SHORT, 2),
    Scalar("unsignedInt", ICU_UNSIGNED_INT, 4),
    Scalar("float", ICU_FLOAT, 4),
    Scalar("double", ICU_DOUBLE, 8),
    Counted("string-", ICU_STRING, ICU_BYTE),
    Counted("binary-", ICU_BINARY, ICU_UNSIGNED_BYTE),
    Scalar("time", ICU_TIME, 10),
    Counted("boolean-", ICU_BOOLEAN_ARRAY, ICU_BOOLEAN),
    Counted("byte-", ICU_BYTE_ARRAY, ICU_BYTE),
    Counted("short-", ICU_SHORT_ARRAY, ICU_SHORT),
    Counted("int-", ICU_INT_ARRAY, ICU_INT),
    Counted("unsignedByte-", ICU_UNSIGNED_BYTE_ARRAY, ICU_UNSIGNED_BYTE),
    Counted("unsignedShort-", ICU_UNSIGNED_SHORT_ARRAY, ICU_UNSIGNED_SHORT),
    Counted("unsignedInt-", ICU_UNSIGNED_INT_ARRAY, ICU_UNSIGNED_INT),
    Counted("float-", ICU_FLOAT_ARRAY, ICU_FLOAT),
    Counted("double-", ICU_DOUBLE_ARRAY, ICU_DOUBLE),
    Counted("time-", ICU_TIME_ARRAY, ICU_TIME),
    Scalar("uint64", ICU_UINT64, 8),
    Scalar("int64", ICU_INT64, 8),
    Counted("uint64-", ICU_UINT64_ARRAY, ICU_UINT64),
    Counted("int64-", ICU_INT64_ARRAY, ICU_INT64),
    Scalar("object", ICU_OBJECT, 0),
}};

bool GetVADOType(const std::string& spec, ICU_Type& type, ICU_Type& itemType, int& length,
                 std::vector<std::string>& params) {
  std::string text = GetTrim(spec);
  const std::size_t open = spec.find('(');
  if (open != std::string::npos) {
    const std::size_t close = spec.find(')');
    if (close == std::string::npos || close < open) {
      return false;
    }
    ParseSubstrings(spec.substr(open + 1, close - open - 1), params, ',');
    text = GetTrim(spec.substr(0, open));
  }

  int count = 1;
  const std::size_t dash = text.find('-');
  if (dash != std::string::npos) {
    count = LeadingNumber(text.substr(dash + 1));
    text.resize(dash + 1);
  }

  const auto* row = std::find_if(DataTypes.begin(), DataTypes.end(),
                                 [&text](const DataType& entry) { return text == entry.name; });
  if (row == DataTypes.end()) {
    return false;
  }
  type = row->type;
  itemType = row->itemType;
  length = row->length != 0
               ? row->length
               : Saturate(static_cast<long long>(GetDataLength(row->itemType)) * count);
  return true;
}

std::string GetVADOName(ICU_Type type, int length) {
  const DataType* row = FindRow(type);
  if (row == nullptr) {
    return "??";
  }
  std::string name = row->name;
  if (row->length == 0) {
    const int itemLength = GetDataLength(row->itemType);
    name += std::to_string(itemLength == 0 ? length : length / itemLength);
  }
  return name;
}

int GetDataLength(ICU_Type type) {
  const DataType* row = FindRow(type);
  return row == nullptr ? 0 : row->length;
}

unsigned int GetTypeFlag(ICU_Type type) {
  const DataType* row = FindRow(type);
  return row == nullptr ? 0 : row->flag;
}

bool IsBitType(ICU_Type type) { return type == ICU_BOOLEAN || type == ICU_BOOLEAN_ARRAY; }

bool IsBitType(const ITag* tag) { return IsBitType(tag->GetVarType()); }

int GetItemCount(int length, ICU_Type itemType) {
  const int itemLength = GetDataLength(itemType);
  return itemLength == 0 ? 1 : length / itemLength;
}

int GetItemCount(const ITag* tag) { return GetItemCount(tag->GetVarLength(), tag->GetItemType()); }

ICU_Type GetBasicType(const ITag* tag) {
  const ICU_Type itemType = tag->GetItemType();
  return itemType != ICU_NONE ? itemType : tag->GetVarType();
}

int GetBasicLength(const ITag* tag) { return GetDataLength(GetBasicType(tag)); }

int GetVersion() { return 200; }

}  // namespace ProtUtilsN
