// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "tests/unit/FailingNew.h"
#include "tests/unit/FakeDriver.h"

namespace {

// A driver whose URIs have fields, and which takes any number of tags into one datagram.
class DatagramDriver final : public FakeDriver {
 public:
  const char* const* tagUriNames() const override {
    static const char* const names[] = {"node", "memorytype", "datatype", nullptr};
    return names;
  }
  bool CanCoexistInDatagram(const ITag* first, const ITag* second) const override {
    seenFirst = first;
    seenSecond = second;
    return coexist;
  }
  int MaxDatagramItems(const ITag* tag) const override {
    seenForItems = tag;
    return maxItems;
  }
  int MaxDatagramLength(const ITag* tag) const override {
    seenForLength = tag;
    return maxLength;
  }

  bool coexist = true;
  int maxItems = 3;
  int maxLength = 100;
  mutable const ITag* seenFirst = nullptr;
  mutable const ITag* seenSecond = nullptr;
  mutable const ITag* seenForItems = nullptr;
  mutable const ITag* seenForLength = nullptr;
};

// A field of the tag's URI, "(null)" without one.
std::string Field(const ProtocolBase& driver, const FakeTag& tag, int index) {
  int length = -77;
  const char* const field = driver.getTagUriField(&tag, index, &length);
  if (field == nullptr) {
    EXPECT_EQ(length, -77);
    return "(null)";
  }
  EXPECT_GE(field, tag.GetVarName());
  EXPECT_LE(field + length, tag.GetVarName() + tag.uri.size());
  return std::string(field, static_cast<std::size_t>(length));
}

}  // namespace

// --- ownership ---

TEST(ProtocolBaseTagsTest, CreatedTagsLiveUntilTheyAreFreed) {
  FakeDriver driver;
  ITag* const first = driver.CreateTag("int");
  ITag* const second = driver.CreateTag("short");
  ASSERT_NE(first, nullptr);
  ASSERT_NE(second, nullptr);
  EXPECT_EQ(FakeTag::Living(), 2);
  EXPECT_STREQ(second->GetVarName(), "short");
  driver.FreeTag(first);
  EXPECT_EQ(FakeTag::Living(), 1);
  driver.FreeTag(second);
  EXPECT_EQ(FakeTag::Living(), 0);
}

TEST(ProtocolBaseTagsTest, RefusedUriMakesNoTag) {
  FakeDriver driver;
  EXPECT_EQ(driver.CreateTag("nonsense"), nullptr);
  EXPECT_EQ(FakeTag::Living(), 0);
  EXPECT_EQ(driver.GetLastError(), -1);
  EXPECT_STREQ(driver.GetLastErrorString(), "Tag URI error: nonsense - no such type");
}

TEST(ProtocolBaseTagsTest, FreeingNothingDoesNothing) {
  FakeDriver driver;
  driver.CreateTag("int");
  driver.FreeTag(nullptr);
  EXPECT_EQ(FakeTag::Living(), 1);
  driver.DeleteTags();
}

TEST(ProtocolBaseTagsTest, TagOutsideTheListIsDestroyedAllTheSame) {
  FakeDriver driver;
  driver.CreateTag("int");
  driver.FreeTag(new FakeTag("int"));
  EXPECT_EQ(FakeTag::Living(), 1);
  driver.DeleteTags();
  EXPECT_EQ(FakeTag::Living(), 0);
}

TEST(ProtocolBaseTagsTest, DeleteTagsLeavesAnEmptyList) {
  FakeDriver driver;
  for (int i = 0; i < 10; ++i) driver.CreateTag("int");
  driver.DeleteTags();
  EXPECT_EQ(FakeTag::Living(), 0);
  driver.DeleteTags();
  EXPECT_NE(driver.CreateTag("int"), nullptr);
  EXPECT_EQ(FakeTag::Living(), 1);
}

TEST(ProtocolBaseTagsTest, DestructorFreesEveryTagOnce) {
  {
    FakeDriver driver;
    for (int i = 0; i < 10; ++i) driver.CreateTag("int");
    EXPECT_EQ(FakeTag::Living(), 10);
  }
  EXPECT_EQ(FakeTag::Living(), 0);
}

TEST(ProtocolBaseTagsTest, NoAllocationThatFailsLeavesHalfATag) {
  for (int nth = 1;; ++nth) {
    FakeDriver driver;
    const FailingNew noMemory(nth);
    ITag* const tag = driver.CreateTag("short-4(swap2,neg)");
    if (!noMemory.HasFailed()) {
      EXPECT_NE(tag, nullptr);
      EXPECT_GT(nth, 3);
      break;
    }
    EXPECT_EQ(tag, nullptr) << nth;
    EXPECT_EQ(FakeTag::Living(), 0) << nth;
    EXPECT_EQ(driver.GetLastError(), -1) << nth;
    EXPECT_STREQ(driver.GetLastErrorString(), "Out of memory") << nth;
  }
}

// --- fields of the URI ---

TEST(ProtocolBaseTagsTest, CountsAndNamesTheFields) {
  const DatagramDriver driver;
  EXPECT_EQ(driver.getTagUriFieldCount(), 3);
  EXPECT_STREQ(driver.getTagUriFieldName(0), "node");
  EXPECT_STREQ(driver.getTagUriFieldName(1), "memorytype");
  EXPECT_STREQ(driver.getTagUriFieldName(2), "datatype");
  for (const int index : {-1, 3, 4, 2147483647, -2147483647 - 1}) {
    EXPECT_EQ(driver.getTagUriFieldName(index), nullptr) << index;
  }
}

TEST(ProtocolBaseTagsTest, OverriddenCountIsHonoured) {
  class FewerFields final : public FakeDriver {
   public:
    const char* const* tagUriNames() const override {
      static const char* const names[] = {"a", "b", nullptr};
      return names;
    }
    int getTagUriFieldCount() const override { return 1; }
  };
  const FewerFields driver;
  EXPECT_STREQ(driver.getTagUriFieldName(0), "a");
  EXPECT_EQ(driver.getTagUriFieldName(1), nullptr);
}

TEST(ProtocolBaseTagsTest, FindsFieldsByExactName) {
  const DatagramDriver driver;
  EXPECT_EQ(driver.getTagUriFieldPosition("node"), 0);
  EXPECT_EQ(driver.getTagUriFieldPosition("memorytype"), 1);
  EXPECT_EQ(driver.getTagUriFieldPosition("datatype"), 2);
  for (const char* name : {"", "Node", "node ", "datatyp", "index"}) {
    EXPECT_EQ(driver.getTagUriFieldPosition(name), -1) << name;
  }
  EXPECT_EQ(driver.getTagUriFieldPosition(nullptr), -1);
}

TEST(ProtocolBaseTagsTest, CutsTheUriIntoFields) {
  const FakeDriver driver;
  FakeTag tag("int");
  tag.uri = "0?rx_token?string-256";
  EXPECT_EQ(Field(driver, tag, 0), "0");
  EXPECT_EQ(Field(driver, tag, 1), "rx_token");
  EXPECT_EQ(Field(driver, tag, 2), "string-256");
  EXPECT_EQ(Field(driver, tag, 3), "(null)");
  EXPECT_EQ(Field(driver, tag, -1), "(null)");
}

TEST(ProtocolBaseTagsTest, FieldPointsIntoTheUri) {
  const FakeDriver driver;
  FakeTag tag("int");
  tag.uri = "ab?cd";
  int length = 0;
  EXPECT_EQ(driver.getTagUriField(&tag, 1, &length), tag.GetVarName() + 3);
  EXPECT_EQ(length, 2);
}

TEST(ProtocolBaseTagsTest, FieldsMayBeEmpty) {
  const FakeDriver driver;
  FakeTag tag("int");
  tag.uri = "?a??b?";
  EXPECT_EQ(Field(driver, tag, 0), "");
  EXPECT_EQ(Field(driver, tag, 1), "a");
  EXPECT_EQ(Field(driver, tag, 2), "");
  EXPECT_EQ(Field(driver, tag, 3), "b");
  EXPECT_EQ(Field(driver, tag, 4), "");
  EXPECT_EQ(Field(driver, tag, 5), "(null)");
  tag.uri = "";
  EXPECT_EQ(Field(driver, tag, 0), "");
  EXPECT_EQ(Field(driver, tag, 1), "(null)");
}

TEST(ProtocolBaseTagsTest, TagWithoutNameHasNoFields) {
  const FakeDriver driver;
  FakeTag tag("int");
  tag.hasName = false;
  EXPECT_EQ(Field(driver, tag, 0), "(null)");
  int length = -77;
  EXPECT_EQ(driver.getTagUriField(nullptr, 0, &length), nullptr);
  EXPECT_EQ(length, -77);
}

TEST(ProtocolBaseTagsTest, LengthOfAFieldNeedNotBeAskedFor) {
  const FakeDriver driver;
  FakeTag tag("int");
  tag.uri = "a?b";
  EXPECT_EQ(driver.getTagUriField(&tag, 1, nullptr), tag.GetVarName() + 2);
}

TEST(ProtocolBaseTagsTest, FieldOperationsLeaveNoError) {
  const DatagramDriver driver;
  FakeTag tag("int");
  Field(driver, tag, 9);
  driver.getTagUriFieldName(9);
  driver.getTagUriFieldPosition("x");
  EXPECT_EQ(driver.GetLastError(), 1);
}

// --- order and adjacency ---

TEST(ProtocolBaseTagsTest, IsBeforeComparesOffsetsUnsigned) {
  const FakeDriver driver;
  FakeTag low("int");
  FakeTag high("int");
  low.byteOffset = 5;
  high.byteOffset = 0x80000000U;
  EXPECT_TRUE(driver.IsBefore(&low, &high));
  EXPECT_FALSE(driver.IsBefore(&high, &low));
  high.byteOffset = 5;
  EXPECT_FALSE(driver.IsBefore(&low, &high));
  EXPECT_FALSE(driver.IsBefore(nullptr, &high));
  EXPECT_FALSE(driver.IsBefore(&low, nullptr));
}

TEST(ProtocolBaseTagsTest, SecondTagIsTheOneInFront) {
  const FakeDriver driver;
  FakeTag front("short");  // bits 0 to 15
  FakeTag behind("int");
  behind.byteOffset = 2;
  EXPECT_TRUE(driver.IsAdjacent(&behind, &front));
  EXPECT_FALSE(driver.IsAdjacent(&front, &behind));
  behind.byteOffset = 3;
  EXPECT_FALSE(driver.IsAdjacent(&behind, &front));
  EXPECT_FALSE(driver.IsAdjacent(nullptr, &front));
  EXPECT_FALSE(driver.IsAdjacent(&behind, nullptr));
}

TEST(ProtocolBaseTagsTest, BitTagsAreAdjacentByBits) {
  const FakeDriver driver;
  FakeTag front("boolean-5");
  front.bitIndex = 1;
  FakeTag behind("boolean");
  behind.bitIndex = 6;
  EXPECT_TRUE(driver.IsAdjacent(&behind, &front));
  behind.bitIndex = 7;
  EXPECT_FALSE(driver.IsAdjacent(&behind, &front));
}

// --- datagrams ---

TEST(ProtocolBaseTagsTest, CandidateMayJoinUpToTheLimits) {
  DatagramDriver driver;
  const FakeTag first("string-30");
  const FakeTag second("string-30");
  const FakeTag candidate("string-40");
  const ITag* const tags[] = {&first, &second};
  EXPECT_TRUE(driver.CanAddToDatagram(tags, 2, &candidate));  // 100 bytes of 100
  EXPECT_EQ(driver.seenFirst, &first);
  EXPECT_EQ(driver.seenSecond, &candidate);
  EXPECT_EQ(driver.seenForItems, &candidate);
  EXPECT_EQ(driver.seenForLength, &candidate);
  driver.maxLength = 99;
  EXPECT_FALSE(driver.CanAddToDatagram(tags, 2, &candidate));
  EXPECT_TRUE(driver.CanAddToDatagram(tags, 1, &candidate));
  driver.maxLength = 100;
  driver.maxItems = 2;
  EXPECT_FALSE(driver.CanAddToDatagram(tags, 2, &candidate));
  EXPECT_TRUE(driver.CanAddToDatagram(tags, 1, &candidate));
}

TEST(ProtocolBaseTagsTest, CandidateThatCannotCoexistMayNotJoin) {
  DatagramDriver driver;
  const FakeTag tag("byte");
  const ITag* const tags[] = {&tag};
  driver.coexist = false;
  EXPECT_FALSE(driver.CanAddToDatagram(tags, 1, &tag));
}

TEST(ProtocolBaseTagsTest, DatagramLengthsAreThoseInTheDevice) {
  DatagramDriver driver;
  const FakeTag bits("boolean-16");  // 16 bytes of value, 2 in the device
  const ITag* const tags[] = {&bits, &bits};
  driver.maxLength = 6;
  EXPECT_TRUE(driver.CanAddToDatagram(tags, 2, &bits));
  driver.maxLength = 5;
  EXPECT_FALSE(driver.CanAddToDatagram(tags, 2, &bits));
}

// Limits that a driver does not set are 0, so agreeing to coexist alone opens no datagram.
TEST(ProtocolBaseTagsTest, NothingJoinsWithoutLimits) {
  DatagramDriver driver;
  const FakeTag tag("string-0");
  const ITag* const tags[] = {&tag};
  driver.maxItems = 0;
  EXPECT_FALSE(driver.CanAddToDatagram(tags, 1, &tag));
  driver.maxItems = 2;
  driver.maxLength = 0;
  EXPECT_TRUE(driver.CanAddToDatagram(tags, 1, &tag));
  const FakeTag longer("byte");
  EXPECT_FALSE(driver.CanAddToDatagram(tags, 1, &longer));
}

TEST(ProtocolBaseTagsTest, DatagramLengthsDoNotOverflow) {
  DatagramDriver driver;
  const FakeTag huge("string-2147483647");
  const ITag* const tags[] = {&huge, &huge};
  EXPECT_FALSE(driver.CanAddToDatagram(tags, 2, &huge));
}

TEST(ProtocolBaseTagsTest, DatagramOfNothingTakesNothing) {
  DatagramDriver driver;
  const FakeTag tag("byte");
  const ITag* const tags[] = {&tag};
  EXPECT_FALSE(driver.CanAddToDatagram(nullptr, 1, &tag));
  EXPECT_FALSE(driver.CanAddToDatagram(tags, 1, nullptr));
  EXPECT_FALSE(driver.CanAddToDatagram(tags, -1, &tag));
}
