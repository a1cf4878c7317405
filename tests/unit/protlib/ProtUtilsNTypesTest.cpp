// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <limits>
#include <string>
#include <vector>

#include "protlib/ProtUtilsN.h"
#include "tests/unit/FakeTag.h"

namespace {

struct ExpectedRow {
  const char* name;
  int code;
  int itemCode;
  int lengthBytes;
  unsigned int flag;
  int elementBytes;  // what GetDataLength answers
};

const std::vector<ExpectedRow> kRows = {
    {"boolean", 1, 0, 1, 0x1, 1},
    {"byte", 2, 0, 1, 0x2, 1},
    {"short", 3, 0, 2, 0x4, 2},
    {"int", 4, 0, 4, 0x8, 4},
    {"unsignedByte", 5, 0, 1, 0x10, 1},
    {"unsignedShort", 6, 0, 2, 0x20, 2},
    {"unsignedInt", 7, 0, 4, 0x40, 4},
    {"float", 8, 0, 4, 0x80, 4},
    {"double", 9, 0, 8, 0x100, 8},
    {"string-", 10, 2, 0, 0x200, 0},
    {"binary-", 11, 5, 0, 0x400, 0},
    {"time", 12, 0, 10, 0x800, 10},
    {"boolean-", 13, 1, 0, 0x1000, 0},
    {"byte-", 14, 2, 0, 0x2000, 0},
    {"short-", 15, 3, 0, 0x4000, 0},
    {"int-", 16, 4, 0, 0x8000, 0},
    {"unsignedByte-", 17, 5, 0, 0x10000, 0},
    {"unsignedShort-", 18, 6, 0, 0x20000, 0},
    {"unsignedInt-", 19, 7, 0, 0x40000, 0},
    {"float-", 20, 8, 0, 0x80000, 0},
    {"double-", 21, 9, 0, 0x100000, 0},
    {"time-", 22, 12, 0, 0x200000, 0},
    {"uint64", 23, 0, 8, 0x400000, 8},
    {"int64", 24, 0, 8, 0x800000, 8},
    {"uint64-", 25, 23, 0, 0x1000000, 0},
    {"int64-", 26, 24, 0, 0x2000000, 0},
    {"object", 27, 0, 0, 0x4000000, 0},
};

ICU_Type Type(int code) { return static_cast<ICU_Type>(code); }

// A specification and what becomes of it. The outputs start with values that no answer has.
struct Parsed {
  bool known;
  int code;
  int itemCode;
  int length;
  std::vector<std::string> params;
};

Parsed Parse(const std::string& spec) {
  ICU_Type type = Type(1001);
  ICU_Type itemType = Type(1002);
  Parsed parsed{false, 0, 0, 1003, {}};
  parsed.known = ProtUtilsN::GetVADOType(spec, type, itemType, parsed.length, parsed.params);
  parsed.code = type;
  parsed.itemCode = itemType;
  return parsed;
}

void ExpectType(const std::string& spec, int code, int itemCode, int length) {
  const Parsed parsed = Parse(spec);
  EXPECT_TRUE(parsed.known) << spec;
  EXPECT_EQ(parsed.code, code) << spec;
  EXPECT_EQ(parsed.itemCode, itemCode) << spec;
  EXPECT_EQ(parsed.length, length) << spec;
}

void ExpectUnknown(const std::string& spec) {
  const Parsed parsed = Parse(spec);
  EXPECT_FALSE(parsed.known) << spec;
  EXPECT_EQ(parsed.code, 1001) << spec;
  EXPECT_EQ(parsed.itemCode, 1002) << spec;
  EXPECT_EQ(parsed.length, 1003) << spec;
}

using Texts = std::vector<std::string>;

}  // namespace

// --- the catalogue ---

TEST(ProtUtilsNTypesTest, CatalogueHasTheRowsOfTheHost) {
  ASSERT_EQ(ProtUtilsN::DataTypes.size(), kRows.size());
  for (std::size_t i = 0; i < kRows.size(); ++i) {
    const ProtUtilsN::DataType& row = ProtUtilsN::DataTypes[i];
    EXPECT_STREQ(row.name, kRows[i].name);
    EXPECT_EQ(row.type, kRows[i].code) << row.name;
    EXPECT_EQ(row.itemType, kRows[i].itemCode) << row.name;
    EXPECT_EQ(row.length, kRows[i].lengthBytes) << row.name;
    EXPECT_EQ(row.flag, kRows[i].flag) << row.name;
    EXPECT_EQ(row.flag, 1U << i) << row.name;
  }
}

TEST(ProtUtilsNTypesTest, EnumeratorsHaveTheCodesOfTheHost) {
  EXPECT_EQ(ICU_NONE, 0);
  EXPECT_EQ(ICU_BOOLEAN, 1);
  EXPECT_EQ(ICU_BYTE, 2);
  EXPECT_EQ(ICU_SHORT, 3);
  EXPECT_EQ(ICU_INT, 4);
  EXPECT_EQ(ICU_UNSIGNED_BYTE, 5);
  EXPECT_EQ(ICU_UNSIGNED_SHORT, 6);
  EXPECT_EQ(ICU_UNSIGNED_INT, 7);
  EXPECT_EQ(ICU_FLOAT, 8);
  EXPECT_EQ(ICU_DOUBLE, 9);
  EXPECT_EQ(ICU_STRING, 10);
  EXPECT_EQ(ICU_BINARY, 11);
  EXPECT_EQ(ICU_TIME, 12);
  EXPECT_EQ(ICU_BOOLEAN_ARRAY, 13);
  EXPECT_EQ(ICU_BYTE_ARRAY, 14);
  EXPECT_EQ(ICU_SHORT_ARRAY, 15);
  EXPECT_EQ(ICU_INT_ARRAY, 16);
  EXPECT_EQ(ICU_UNSIGNED_BYTE_ARRAY, 17);
  EXPECT_EQ(ICU_UNSIGNED_SHORT_ARRAY, 18);
  EXPECT_EQ(ICU_UNSIGNED_INT_ARRAY, 19);
  EXPECT_EQ(ICU_FLOAT_ARRAY, 20);
  EXPECT_EQ(ICU_DOUBLE_ARRAY, 21);
  EXPECT_EQ(ICU_TIME_ARRAY, 22);
  EXPECT_EQ(ICU_UINT64, 23);
  EXPECT_EQ(ICU_INT64, 24);
  EXPECT_EQ(ICU_UINT64_ARRAY, 25);
  EXPECT_EQ(ICU_INT64_ARRAY, 26);
  EXPECT_EQ(ICU_OBJECT, 27);
}

TEST(ProtUtilsNTypesTest, DataLengthOfEveryCode) {
  for (const ExpectedRow& row : kRows) {
    EXPECT_EQ(ProtUtilsN::GetDataLength(Type(row.code)), row.elementBytes) << row.name;
  }
  for (const int code : {-1, 0, 28, 99, 2147483647}) {
    EXPECT_EQ(ProtUtilsN::GetDataLength(Type(code)), 0) << code;
  }
}

TEST(ProtUtilsNTypesTest, FlagOfEveryCode) {
  for (const ExpectedRow& row : kRows) {
    EXPECT_EQ(ProtUtilsN::GetTypeFlag(Type(row.code)), row.flag) << row.name;
  }
  for (const int code : {-1, 0, 28, 99, 2147483647}) {
    EXPECT_EQ(ProtUtilsN::GetTypeFlag(Type(code)), 0U) << code;
  }
}

TEST(ProtUtilsNTypesTest, ExactlyTheBooleansAreBitTypes) {
  for (int code = -1; code < 40; ++code) {
    EXPECT_EQ(ProtUtilsN::IsBitType(Type(code)), code == 1 || code == 13) << code;
    FakeTag tag;
    tag.type = Type(code);
    EXPECT_EQ(ProtUtilsN::IsBitType(&tag), code == 1 || code == 13) << code;
  }
}

TEST(ProtUtilsNTypesTest, VersionIs200) { EXPECT_EQ(ProtUtilsN::GetVersion(), 200); }

// --- specifications ---

TEST(ProtUtilsNTypesTest, EveryNameIsASpecification) {
  for (const ExpectedRow& row : kRows) {
    const bool isCounted = row.itemCode != 0;
    ExpectType(row.name, row.code, row.itemCode, row.lengthBytes);  // counted: no count is 0
    if (isCounted) {
      const int itemBytes = kRows[static_cast<std::size_t>(row.itemCode) - 1].elementBytes;
      ExpectType(std::string(row.name) + "7", row.code, row.itemCode, 7 * itemBytes);
    }
  }
}

TEST(ProtUtilsNTypesTest, SpecificationExamples) {
  ExpectType("int", 4, 0, 4);
  ExpectType("string-20", 10, 2, 20);
  ExpectType("int-4", 16, 4, 16);
  ExpectType("boolean-16", 13, 1, 16);
  ExpectType("binary-8", 11, 5, 8);
  ExpectType("uint64-2", 25, 23, 16);
  ExpectType("int-", 16, 4, 0);
  ExpectType("time-3", 22, 12, 30);
  ExpectUnknown("Int");
}

TEST(ProtUtilsNTypesTest, BlanksAroundTheSpecificationDoNotCount) {
  ExpectType(" \tint ", 4, 0, 4);
  ExpectType(" int (swap4)", 4, 0, 4);
  ExpectUnknown("\nint");
  ExpectUnknown("int -4");
}

TEST(ProtUtilsNTypesTest, CountIsTheDigitsDirectlyBehindTheDash) {
  ExpectType("int-2x3", 16, 4, 8);
  ExpectType("int-x2", 16, 4, 0);
  ExpectType("int- 2", 16, 4, 0);
  ExpectType("int-+2", 16, 4, 0);
  ExpectType("int--2", 16, 4, 0);
  ExpectType("int-0x10", 16, 4, 0);
  ExpectType("int-010", 16, 4, 40);
  ExpectType("string-5-7", 10, 2, 5);
}

TEST(ProtUtilsNTypesTest, DashBelongsToTheName) {
  ExpectUnknown("object-3");
  ExpectUnknown("string");
  ExpectUnknown("binary");
  ExpectUnknown("-");
  ExpectUnknown("-int");
}

TEST(ProtUtilsNTypesTest, UnknownNamesChangeNothing) {
  for (const char* spec : {"", " ", "integer", "strin-10", "STRING-10", "boolean16", "(neg)"}) {
    ExpectUnknown(spec);
  }
}

TEST(ProtUtilsNTypesTest, CountsAndLengthsSaturate) {
  const int largest = std::numeric_limits<int>::max();
  ExpectType("string-2147483647", 10, 2, largest);
  ExpectType("string-2147483648", 10, 2, largest);
  ExpectType("string-99999999999999999999999999", 10, 2, largest);
  ExpectType("int-536870911", 16, 4, 2147483644);
  ExpectType("int-536870912", 16, 4, largest);
  ExpectType("int-1073741824", 16, 4, largest);  // 2^32 bytes
  ExpectType("int-1073741825", 16, 4, largest);  // 2^32 + 4 bytes
  ExpectType("double-4294967297", 21, 9, largest);
}

TEST(ProtUtilsNTypesTest, ConversionsStandInParentheses) {
  EXPECT_EQ(Parse("unsignedShort(swap2)").params, Texts{"swap2"});
  ExpectType("unsignedShort(swap2)", 6, 0, 2);
  EXPECT_EQ(Parse("string-20(a,b)").params, (Texts{"a", "b"}));
  ExpectType("string-20(a,b)", 10, 2, 20);
  EXPECT_EQ(Parse("int( a , b )").params, (Texts{"a", "b"}));
  EXPECT_EQ(Parse("int()").params, Texts{""});
  EXPECT_EQ(Parse("int(a,)").params, (Texts{"a", ""}));
  EXPECT_EQ(Parse("int").params, Texts{});
}

TEST(ProtUtilsNTypesTest, TextBehindTheParenthesesDoesNotCount) {
  ExpectType("int(a)-7", 4, 0, 4);
  EXPECT_EQ(Parse("int(a)(b)").params, Texts{"a"});
  EXPECT_EQ(Parse("int((a))").params, Texts{"(a"});
}

TEST(ProtUtilsNTypesTest, UnclosedParenthesisFailsWithEverythingUntouched) {
  for (const char* spec : {"int(x", "int(", "(", ")int(swap4", ")("}) {
    ExpectUnknown(spec);
    EXPECT_EQ(Parse(spec).params, Texts{}) << spec;
  }
}

TEST(ProtUtilsNTypesTest, CloseWithoutOpenBelongsToTheName) {
  ExpectUnknown("int)");
  ExpectUnknown(")int");
}

TEST(ProtUtilsNTypesTest, ConversionsAreAppended) {
  ICU_Type type = ICU_NONE;
  ICU_Type itemType = ICU_NONE;
  int length = 0;
  Texts params = {"old"};
  EXPECT_TRUE(ProtUtilsN::GetVADOType("int(new)", type, itemType, length, params));
  EXPECT_EQ(params, (Texts{"old", "new"}));
}

// The parentheses are cut before the name is looked up.
TEST(ProtUtilsNTypesTest, ConversionsOfAnUnknownNameAreStillGiven) {
  ExpectUnknown("nosuch(a,b)");
  EXPECT_EQ(Parse("nosuch(a,b)").params, (Texts{"a", "b"}));
  EXPECT_EQ(Parse("(neg)").params, Texts{"neg"});
}

// --- names ---

TEST(ProtUtilsNTypesTest, NameExamples) {
  EXPECT_EQ(ProtUtilsN::GetVADOName(Type(10), 20), "string-20");
  EXPECT_EQ(ProtUtilsN::GetVADOName(Type(4), 4), "int");
  EXPECT_EQ(ProtUtilsN::GetVADOName(Type(16), 16), "int-4");
  EXPECT_EQ(ProtUtilsN::GetVADOName(Type(27), 12), "object12");
  EXPECT_EQ(ProtUtilsN::GetVADOName(Type(22), 30), "time-3");
}

TEST(ProtUtilsNTypesTest, CodesThatAreNoTypeHaveNoName) {
  for (const int code : {-1, 0, 28, 99}) {
    EXPECT_EQ(ProtUtilsN::GetVADOName(Type(code), 4), "??") << code;
  }
}

TEST(ProtUtilsNTypesTest, LengthOfAScalarDoesNotShow) {
  EXPECT_EQ(ProtUtilsN::GetVADOName(Type(1), 100), "boolean");
  EXPECT_EQ(ProtUtilsN::GetVADOName(Type(12), 0), "time");
}

TEST(ProtUtilsNTypesTest, CountIsRoundedDown) {
  EXPECT_EQ(ProtUtilsN::GetVADOName(Type(16), 15), "int-3");
  EXPECT_EQ(ProtUtilsN::GetVADOName(Type(16), 0), "int-0");
}

TEST(ProtUtilsNTypesTest, NameAndSpecificationAreInverse) {
  for (const ExpectedRow& row : kRows) {
    if (row.code == ICU_OBJECT) continue;
    for (const int count : {0, 1, 2, 33}) {
      std::string spec = row.name;
      if (row.itemCode != 0) spec += std::to_string(count);
      const Parsed parsed = Parse(spec);
      EXPECT_EQ(ProtUtilsN::GetVADOName(Type(parsed.code), parsed.length), spec);
    }
  }
}

// --- items ---

TEST(ProtUtilsNTypesTest, ItemCounts) {
  EXPECT_EQ(ProtUtilsN::GetItemCount(10, Type(2)), 10);
  EXPECT_EQ(ProtUtilsN::GetItemCount(10, Type(0)), 1);
  EXPECT_EQ(ProtUtilsN::GetItemCount(10, Type(4)), 2);
  EXPECT_EQ(ProtUtilsN::GetItemCount(0, Type(4)), 0);
  EXPECT_EQ(ProtUtilsN::GetItemCount(29, Type(12)), 2);
  for (const ExpectedRow& row : kRows) {
    EXPECT_EQ(ProtUtilsN::GetItemCount(50, Type(row.code)),
              row.elementBytes == 0 ? 1 : 50 / row.elementBytes)
        << row.name;
  }
  for (const int codeWithoutLength : {10, 25, 27, 28}) {
    EXPECT_EQ(ProtUtilsN::GetItemCount(10, Type(codeWithoutLength)), 1) << codeWithoutLength;
  }
}

TEST(ProtUtilsNTypesTest, ItemsOfTags) {
  const FakeTag array("short-5");
  EXPECT_EQ(ProtUtilsN::GetItemCount(&array), 5);
  EXPECT_EQ(ProtUtilsN::GetBasicType(&array), ICU_SHORT);
  EXPECT_EQ(ProtUtilsN::GetBasicLength(&array), 2);

  const FakeTag scalar("double");
  EXPECT_EQ(ProtUtilsN::GetItemCount(&scalar), 1);
  EXPECT_EQ(ProtUtilsN::GetBasicType(&scalar), ICU_DOUBLE);
  EXPECT_EQ(ProtUtilsN::GetBasicLength(&scalar), 8);

  const FakeTag text("string-9");
  EXPECT_EQ(ProtUtilsN::GetItemCount(&text), 9);
  EXPECT_EQ(ProtUtilsN::GetBasicType(&text), ICU_BYTE);
  EXPECT_EQ(ProtUtilsN::GetBasicLength(&text), 1);

  const FakeTag object("object");
  EXPECT_EQ(ProtUtilsN::GetItemCount(&object), 1);
  EXPECT_EQ(ProtUtilsN::GetBasicType(&object), ICU_OBJECT);
  EXPECT_EQ(ProtUtilsN::GetBasicLength(&object), 0);
}
