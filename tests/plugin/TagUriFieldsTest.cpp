// SPDX-License-Identifier: Apache-2.0
// Creating and freeing tags, the fields of a tag URI, and the order of tags.
#include <climits>

#include "tests/plugin/PluginFixture.h"

namespace {

class TagUriFieldsTest : public ProtocolFixture {
 protected:
  void SetUp() override {
    ProtocolFixture::SetUp();
    ASSERT_TRUE(P().Config(Mandatory()));
  }
  // The field with its length, or "null" when there is none and the length is untouched.
  std::string Field(const ITag* tag, int index) {
    int length = -77;
    const char* start = P()->getTagUriField(tag, index, &length);
    if (start == nullptr) return length == -77 ? "null" : "null, but length written";
    EXPECT_GE(start, tag->GetVarName());
    return std::string(start, start + length);
  }
};

TEST_F(TagUriFieldsTest, Names) {
  EXPECT_EQ(P()->getTagUriFieldCount(), 3);
  EXPECT_STREQ(P()->getTagUriFieldName(0), "node");
  EXPECT_STREQ(P()->getTagUriFieldName(1), "memorytype");
  EXPECT_STREQ(P()->getTagUriFieldName(2), "datatype");
  for (const int index : {-1, 3, 4, INT_MIN, INT_MAX}) {
    EXPECT_EQ(P()->getTagUriFieldName(index), nullptr) << index;
  }
}

TEST_F(TagUriFieldsTest, Positions) {
  EXPECT_EQ(P()->getTagUriFieldPosition("node"), 0);
  EXPECT_EQ(P()->getTagUriFieldPosition("memorytype"), 1);
  EXPECT_EQ(P()->getTagUriFieldPosition("datatype"), 2);
  for (const char* name : {"", "Node", "memoryType", "memorytype ", "vadoType", "mem"}) {
    EXPECT_EQ(P()->getTagUriFieldPosition(name), -1) << name;
  }
  EXPECT_EQ(P()->getTagUriFieldPosition(nullptr), -1);
}

TEST_F(TagUriFieldsTest, FieldsOfAUri) {
  const ITag* tag = P().Tag("17?rx_token?string-256");
  ASSERT_NE(tag, nullptr);
  EXPECT_EQ(Field(tag, 0), "17");
  EXPECT_EQ(Field(tag, 1), "rx_token");
  EXPECT_EQ(Field(tag, 2), "string-256");
  EXPECT_EQ(Field(tag, 3), "null");
  EXPECT_EQ(Field(tag, 1000), "null");
  EXPECT_EQ(Field(tag, -1), "null");
  EXPECT_EQ(P().Error(), "1 ");
}

TEST_F(TagUriFieldsTest, EmptyAndBlankFieldsAreKeptAsWritten) {
  const ITag* tag = P().Tag("? SP_Done ? boolean ");
  ASSERT_NE(tag, nullptr);
  EXPECT_EQ(Field(tag, 0), "");
  EXPECT_EQ(Field(tag, 1), " SP_Done ");
  EXPECT_EQ(Field(tag, 2), " boolean ");
  EXPECT_EQ(Field(tag, 3), "null");
}

TEST_F(TagUriFieldsTest, FieldsPointIntoTheTagsOwnText) {
  const ITag* tag = P().Tag("0?connect?boolean");
  ASSERT_NE(tag, nullptr);
  int length = 0;
  EXPECT_EQ(P()->getTagUriField(tag, 1, &length), tag->GetVarName() + 2);
  EXPECT_EQ(length, 7);
}

TEST_F(TagUriFieldsTest, OrderOfTags) {
  const ITag* a = P().Tag("0?rx_token?string-10");
  const ITag* b = P().Tag("0?SP_Baud?unsignedInt");
  const ITag* empty = P().Tag("0?rx_token?string-0");
  const ITag* flag = P().Tag("0?connect?boolean");
  // Every tag starts at offset 0, so none is before another and only an empty one ends at 0.
  for (const ITag* first : {a, b, empty, flag}) {
    for (const ITag* second : {a, b, empty, flag}) {
      EXPECT_FALSE(P()->IsBefore(first, second));
      EXPECT_EQ(P()->IsAdjacent(first, second), second == empty);
    }
  }
}

// Tags of the test's own make the comparisons visible at other offsets.
class OwnTag final : public ITag {
 public:
  OwnTag(unsigned offset, int bit, ICU_Type type, int length)
      : offset_(offset), bit_(bit), type_(type), length_(length) {}
  ITag* Clone() const override { return new OwnTag(*this); }
  unsigned int GetByteOffset() const override { return offset_; }
  int GetBitIndex() const override { return bit_; }
  const char* GetVarName() const override { return name_; }
  ICU_Type GetVarType() const override { return type_; }
  int GetVarLength() const override { return length_; }
  ICU_Type GetItemType() const override { return ICU_NONE; }
  int PackedLen() const override { return packed_ != 0 ? packed_ : length_; }
  bool ConvertVariable(const unsigned char*, unsigned char*, bool) const override { return false; }
  bool IsReadOnly() const override { return false; }
  bool IsWriteOnly() const override { return false; }
  bool Convert(const unsigned char*, unsigned char*, bool) const override { return false; }
  bool DoConversion(unsigned char*, const char*, bool) const override { return false; }

  unsigned offset_;
  int bit_;
  ICU_Type type_;
  int length_;
  int packed_ = 0;
  const char* name_ = nullptr;
};

TEST_F(TagUriFieldsTest, AdjacencyCountsBits) {
  OwnTag front(0, 0, ICU_SHORT, 2);
  OwnTag behind(2, 0, ICU_SHORT, 2);
  EXPECT_TRUE(P()->IsAdjacent(&behind, &front));
  EXPECT_FALSE(P()->IsAdjacent(&front, &behind));
  EXPECT_TRUE(P()->IsBefore(&front, &behind));
  EXPECT_FALSE(P()->IsBefore(&behind, &front));
  EXPECT_FALSE(P()->IsBefore(&front, &front));

  OwnTag bits(1, 3, ICU_BOOLEAN_ARRAY, 5);      // bits 11 to 15
  OwnTag nextBits(2, 0, ICU_BOOLEAN_ARRAY, 1);  // bit 16
  EXPECT_TRUE(P()->IsAdjacent(&nextBits, &bits));
  EXPECT_TRUE(P()->IsAdjacent(&behind, &bits));
  EXPECT_FALSE(P()->IsAdjacent(&bits, &nextBits));

  // A bit index counts for bit types only, and the packed length for the others only.
  OwnTag odd(2, 5, ICU_SHORT, 2);
  EXPECT_TRUE(P()->IsAdjacent(&odd, &front));
  front.packed_ = 3;
  EXPECT_FALSE(P()->IsAdjacent(&odd, &front));
}

TEST_F(TagUriFieldsTest, OffsetsCompareUnsigned) {
  OwnTag low(1, 0, ICU_BYTE, 1);
  OwnTag high(0x80000000U, 0, ICU_BYTE, 1);
  EXPECT_TRUE(P()->IsBefore(&low, &high));
  EXPECT_FALSE(P()->IsBefore(&high, &low));
}

TEST_F(TagUriFieldsTest, ATagWithoutANameHasNoFields) {
  OwnTag nameless(0, 0, ICU_BYTE, 1);
  EXPECT_EQ(Field(&nameless, 0), "null");
}

TEST_F(TagUriFieldsTest, AnyTextIsCutIntoFields) {
  OwnTag tag(0, 0, ICU_BYTE, 1);
  tag.name_ = "";
  EXPECT_EQ(Field(&tag, 0), "");
  EXPECT_EQ(Field(&tag, 1), "null");
  tag.name_ = "a??b?";
  EXPECT_EQ(Field(&tag, 0), "a");
  EXPECT_EQ(Field(&tag, 1), "");
  EXPECT_EQ(Field(&tag, 2), "b");
  EXPECT_EQ(Field(&tag, 3), "");
  EXPECT_EQ(Field(&tag, 4), "null");
}

TEST_F(TagUriFieldsTest, ARefusedUriGivesNoTag) {
  EXPECT_EQ(P().Tag("nonsense"), nullptr);
  EXPECT_EQ(P().Error(), "-1 Tag URI error: nonsense - there must be 3 tag specification fields");
}

TEST_F(TagUriFieldsTest, FreeingTags) {
  P()->FreeTag(nullptr);
  ITag* first = P().Tag("0?connect?boolean");
  ITag* second = P().Tag("0?connect?boolean");
  ITag* third = P().Tag("0?connect?boolean");
  ASSERT_NE(first, second);
  P()->FreeTag(second);
  EXPECT_STREQ(first->GetVarName(), "0?connect?boolean");
  EXPECT_STREQ(third->GetVarName(), "0?connect?boolean");
  P()->FreeTag(first);
  EXPECT_STREQ(third->GetVarName(), "0?connect?boolean");
  // The third is left to the protocol's end; the address sanitizer counts.
}

// A tag that the protocol does not list is destroyed all the same.
class CountedTag {
 public:
  static int alive;
};
int CountedTag::alive = 0;

class LeavingTag final : public ITag {
 public:
  LeavingTag() { ++CountedTag::alive; }
  ~LeavingTag() override { --CountedTag::alive; }
  LeavingTag(const LeavingTag&) = delete;
  LeavingTag& operator=(const LeavingTag&) = delete;
  ITag* Clone() const override { return nullptr; }
  unsigned int GetByteOffset() const override { return 0; }
  int GetBitIndex() const override { return 0; }
  const char* GetVarName() const override { return "leaving"; }
  ICU_Type GetVarType() const override { return ICU_BYTE; }
  int GetVarLength() const override { return 1; }
  ICU_Type GetItemType() const override { return ICU_NONE; }
  int PackedLen() const override { return 1; }
  bool ConvertVariable(const unsigned char*, unsigned char*, bool) const override { return false; }
  bool IsReadOnly() const override { return false; }
  bool IsWriteOnly() const override { return false; }
  bool Convert(const unsigned char*, unsigned char*, bool) const override { return false; }
  bool DoConversion(unsigned char*, const char*, bool) const override { return false; }
};

TEST_F(TagUriFieldsTest, FreeingATagThatIsNotListed) {
  ITag* clone = P().Tag("0?connect?boolean")->Clone();
  ASSERT_NE(clone, nullptr);
  P()->FreeTag(clone);
  P()->FreeTag(new LeavingTag);
  EXPECT_EQ(CountedTag::alive, 0);
}

TEST_F(TagUriFieldsTest, CloneIsEqualAndIndependent) {
  ITag* tag = P().Tag("0?SP_Baud?unsignedInt(swap4,swap2)");
  ASSERT_NE(tag, nullptr);
  ITag* clone = tag->Clone();
  ASSERT_NE(clone, nullptr);
  P()->FreeTag(tag);
  EXPECT_STREQ(clone->GetVarName(), "0?SP_Baud?unsignedInt(swap4,swap2)");
  EXPECT_EQ(clone->GetVarType(), ICU_UNSIGNED_INT);
  EXPECT_EQ(clone->GetVarLength(), 4);
  EXPECT_EQ(P()->GetNodeID(clone), 0);
  const unsigned char in[4] = {1, 2, 3, 4};
  unsigned char out[4] = {};
  EXPECT_TRUE(clone->Convert(in, out, true));
  EXPECT_EQ(std::string(out, out + 4), std::string("\x03\x04\x01\x02"));
  delete clone;
}

}  // namespace
