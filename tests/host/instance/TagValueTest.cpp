// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "host/instance/TagValue.h"
#include "interfaces/ITag.h"

namespace {

// A tag of a type and a length; nothing else of it is asked for.
class TypedTag final : public ITag {
 public:
  TypedTag(ICU_Type type, int length) : type_(type), length_(length) {}
  ITag* Clone() const override { return nullptr; }
  unsigned int GetByteOffset() const override { return 0; }
  int GetBitIndex() const override { return 0; }
  const char* GetVarName() const override { return ""; }
  ICU_Type GetVarType() const override { return type_; }
  int GetVarLength() const override { return length_; }
  ICU_Type GetItemType() const override { return ICU_NONE; }
  int PackedLen() const override { return length_; }
  bool ConvertVariable(const unsigned char*, unsigned char*, bool) const override { return false; }
  bool IsReadOnly() const override { return false; }
  bool IsWriteOnly() const override { return false; }
  bool Convert(const unsigned char*, unsigned char*, bool) const override { return false; }
  bool DoConversion(unsigned char*, const char*, bool) const override { return false; }

 private:
  const ICU_Type type_;
  const int length_;
};

struct Case {
  const char* name;
  ICU_Type type;
  int length;
  std::string text;
  std::string bytes;
};

class TagValueTest : public testing::TestWithParam<Case> {};

TEST_P(TagValueTest, IsReadAndWritten) {
  const Case& c = GetParam();
  const TypedTag tag(c.type, c.length);
  std::string bytes;
  std::string error;
  ASSERT_TRUE(ParseTagValue(tag, c.text, &bytes, &error)) << error;
  EXPECT_EQ(bytes, c.bytes);
  EXPECT_EQ(ShowTagValue(tag, bytes), c.text);
}

std::vector<Case> Cases() {
  return {{"BooleanOff", ICU_BOOLEAN, 1, "0", std::string(1, '\0')},
          {"BooleanOn", ICU_BOOLEAN, 1, "1", "\x01"},
          {"UnsignedByte", ICU_UNSIGNED_BYTE, 1, "255", "\xFF"},
          {"Byte", ICU_BYTE, 1, "-1", "\xFF"},
          {"Short", ICU_SHORT, 2, "-2", "\xFE\xFF"},
          {"UnsignedShort", ICU_UNSIGNED_SHORT, 2, "513", "\x01\x02"},
          {"Int", ICU_INT, 4, "-2147483648", std::string("\0\0\0\x80", 4)},
          {"UnsignedInt", ICU_UNSIGNED_INT, 4, "4294967295", "\xFF\xFF\xFF\xFF"},
          {"Float", ICU_FLOAT, 4, "1.5", std::string("\0\0\xC0\x3F", 4)},
          {"EmptyText", ICU_STRING, 4, "", std::string(4, '\0')},
          {"Text", ICU_STRING, 4, "a\xFF\n", std::string("a\xFF\n\0", 4)},
          {"Bytes", ICU_BINARY, 2, "00FF", std::string("\0\xFF", 2)}};
}

INSTANTIATE_TEST_SUITE_P(Types, TagValueTest, testing::ValuesIn(Cases()),
                         [](const auto& entry) { return std::string(entry.param.name); });

TEST(TagValueErrors, SayWhatIsExpected) {
  const auto errorOf = [](ICU_Type type, int length, const std::string& text) {
    std::string bytes = "untouched";
    std::string error = "accepted";
    (void)ParseTagValue(TypedTag(type, length), text, &bytes, &error);
    return error;
  };
  EXPECT_EQ(errorOf(ICU_UNSIGNED_BYTE, 1, "256"), "expected a number from 0 to 255, not \"256\"");
  EXPECT_EQ(errorOf(ICU_UNSIGNED_INT, 4, "-1"),
            "expected a number from 0 to 4294967295, not \"-1\"");
  EXPECT_EQ(errorOf(ICU_UNSIGNED_INT, 4, ""), "expected a number from 0 to 4294967295, not \"\"");
  EXPECT_EQ(errorOf(ICU_UNSIGNED_INT, 4, "1\x1B"),
            "expected a number from 0 to 4294967295, not \"1\\x1b\"");
  EXPECT_EQ(errorOf(ICU_BOOLEAN, 1, "2"), "expected 0 or 1, not \"2\"");
  EXPECT_EQ(errorOf(ICU_STRING, 3, "abc"), "the text has 3 bytes and needs string-4 or longer");
  EXPECT_EQ(errorOf(ICU_STRING, 9, std::string("a\0b", 3)),
            "a text tag ends at the first zero byte; send bytes with hex_tokens=true");
  EXPECT_EQ(errorOf(ICU_STRING, 0, ""), "the text has 0 bytes and needs string-1 or longer");
  EXPECT_EQ(errorOf(ICU_BINARY, 2, "0"), "expected 2 bytes as hexadecimal digits");
}

TEST(TagValueShow, ShortBytesAreNoNumber) {
  EXPECT_EQ(ShowTagValue(TypedTag(ICU_INT, 4), "abc"), "");
}

}  // namespace
