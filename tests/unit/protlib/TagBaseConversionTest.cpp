// SPDX-License-Identifier: Apache-2.0
// What each conversion keyword does, and to which types.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "tests/unit/protlib/TagConversion.h"

namespace {

template <typename Number>
Bytes Joined(const std::vector<Number>& numbers) {
  Bytes bytes;
  for (const Number number : numbers) {
    const Bytes more = BytesOf(number);
    bytes.insert(bytes.end(), more.begin(), more.end());
  }
  return bytes;
}

Bytes Counting(int lengthBytes) {
  Bytes bytes;
  for (int i = 1; i <= lengthBytes; ++i) bytes.push_back(static_cast<unsigned char>(i));
  return bytes;
}

// Every name of a scalar type, with an array of two for the counted ones.
const std::vector<std::string> kAllSpecs = {
    "boolean", "byte",        "short",   "int",      "unsignedByte",   "unsignedShort",
    "float",   "unsignedInt", "double",  "string-2", "binary-2",       "time",
    "uint64",  "boolean-2",   "byte-2",  "short-2",  "unsignedByte-2", "unsignedShort-2",
    "int64",   "int-2",       "float-2", "double-2", "unsignedInt-2",  "time-2",
    "object",  "uint64-2",    "int64-2"};

bool IsOneOf(const std::string& spec, const std::vector<std::string>& list) {
  for (const std::string& entry : list) {
    if (entry == spec) return true;
  }
  return false;
}

// Which types a conversion accepts: exactly the listed ones, in both directions.
void ExpectAcceptedBy(const std::string& keyword, const std::vector<std::string>& accepted) {
  for (const std::string& type : kAllSpecs) {
    const FakeTag tag(type + "(" + keyword + ")");
    Bytes src(32, 0);
    for (const bool toDevice : {kToDevice, kToHost}) {
      Bytes dst(32, 0);
      EXPECT_EQ(tag.Convert(src.data(), dst.data(), toDevice), IsOneOf(type, accepted))
          << type << " " << keyword;
    }
  }
}

}  // namespace

// --- swaps ---

TEST(TagBaseConversionTest, SwapNibbleExchangesTheHalvesOfEachByte) {
  ExpectBothWays("unsignedByte(swapnibble)", {0x12}, {0x21});
  ExpectBothWays("string-3(swapnibble)", {0x12, 0xF0, 0xAB}, {0x21, 0x0F, 0xBA});
  ExpectBothWays("time(swapnibble)", Counting(10),
                 {0x10, 0x20, 0x30, 0x40, 0x50, 0x60, 0x70, 0x80, 0x90, 0xA0});
}

TEST(TagBaseConversionTest, SwapNibbleTakesEveryType) { ExpectAcceptedBy("swapnibble", kAllSpecs); }

TEST(TagBaseConversionTest, SwapsReverseTheirGroups) {
  ExpectBothWays("short(swap2)", {1, 2}, {2, 1});
  ExpectBothWays("binary-6(swap2)", {1, 2, 3, 4, 5, 6}, {2, 1, 4, 3, 6, 5});
  ExpectBothWays("int(swap4)", {1, 2, 3, 4}, {4, 3, 2, 1});
  ExpectBothWays("int-2(swap4)", Counting(8), {4, 3, 2, 1, 8, 7, 6, 5});
  ExpectBothWays("double(swap8)", Counting(8), {8, 7, 6, 5, 4, 3, 2, 1});
  ExpectBothWays("uint64-2(swap8)", Counting(16),
                 {8, 7, 6, 5, 4, 3, 2, 1, 16, 15, 14, 13, 12, 11, 10, 9});
  ExpectBothWays("double(swap2)", Counting(8), {2, 1, 4, 3, 6, 5, 8, 7});
}

TEST(TagBaseConversionTest, SwapsFailOnAnIncompleteGroup) {
  ExpectFailureBothWays("string-3(swap2)", "swap2");
  ExpectFailureBothWays("byte(swap2)", "swap2");
  for (const int rest : {1, 2, 3}) {
    ExpectFailureBothWays("binary-" + std::to_string(4 + rest) + "(swap4)", "swap4");
  }
  for (int rest = 1; rest < 8; ++rest) {
    ExpectFailureBothWays("binary-" + std::to_string(8 + rest) + "(swap8)", "swap8");
  }
}

TEST(TagBaseConversionTest, SwapsOfNothingSucceed) {
  for (const char* keyword : {"swap2", "swap4", "swap8"}) {
    const FakeTag tag(std::string("string-0(") + keyword + ")");
    unsigned char byte = 0x5A;
    EXPECT_TRUE(tag.DoConversion(&byte, keyword, kToDevice));
    EXPECT_EQ(byte, 0x5A);
  }
}

TEST(TagBaseConversionTest, SwapsOfBitsSwapTheHostBytes) {
  EXPECT_EQ(ToHost("boolean-4(swap2)", {0x05}), (Bytes{0, 1, 0, 1}));
  EXPECT_EQ(ToDevice("boolean-4(swap4)", {1, 1, 0, 0}), Bytes{0x0C | (0xA5 & 0xF0)});
}

// --- bcd ---

TEST(TagBaseConversionTest, BcdPutsTheUnitsInTheLowestNibble) {
  EXPECT_EQ(ToDevice("unsignedShort(bcd)", {0xD2, 0x04}), (Bytes{0x34, 0x12}));
  EXPECT_EQ(ToHost("unsignedShort(bcd)", {0x34, 0x12}), (Bytes{0xD2, 0x04}));
  EXPECT_EQ(ToDevice("unsignedByte(bcd)", {99}), Bytes{0x99});
  EXPECT_EQ(ToHost("unsignedByte(bcd)", {0x99}), Bytes{99});
  EXPECT_EQ(ToDevice("unsignedInt(bcd)", BytesOf(12345678U)), (Bytes{0x78, 0x56, 0x34, 0x12}));
  EXPECT_EQ(ToHost("unsignedInt(bcd)", {0x78, 0x56, 0x34, 0x12}), BytesOf(12345678U));
}

TEST(TagBaseConversionTest, BcdGoesThereAndBackForEveryByte) {
  for (int value = 0; value < 256; ++value) {
    const Bytes host = {static_cast<unsigned char>(value)};
    if (value > 99) {
      ExpectFailure("unsignedByte(bcd)", host, kToDevice, "bcd");
    } else {
      const Bytes coded = {static_cast<unsigned char>(value / 10 * 16 + value % 10)};
      EXPECT_EQ(ToDevice("unsignedByte(bcd)", host), coded) << value;
      EXPECT_EQ(ToHost("unsignedByte(bcd)", coded), host) << value;
    }
  }
}

TEST(TagBaseConversionTest, BcdFailsOnEveryNibbleAboveNine) {
  for (int image = 0; image < 256; ++image) {
    const Bytes bytes = {static_cast<unsigned char>(image)};
    const bool isCode = image / 16 <= 9 && image % 16 <= 9;
    const Bytes value = {static_cast<unsigned char>(image / 16 * 10 + image % 16)};
    EXPECT_EQ(ToHost("unsignedByte(bcd)", bytes), isCode ? value : Bytes{}) << image;
  }
  ExpectFailure("unsignedShort(bcd)", {0x3A, 0x12}, kToHost, "bcd");
  ExpectFailure("unsignedShort(bcd)", {0x34, 0xA2}, kToHost, "bcd");
  ExpectFailure("unsignedInt(bcd)", {0x34, 0x12, 0x00, 0x0B}, kToHost, "bcd");
}

TEST(TagBaseConversionTest, BcdHasALargestValueForEachLength) {
  ExpectFailure("unsignedByte(bcd)", {100}, kToDevice, "bcd");
  EXPECT_EQ(ToDevice("unsignedShort(bcd)", BytesOf<unsigned short>(9999)), (Bytes{0x99, 0x99}));
  ExpectFailure("unsignedShort(bcd)", BytesOf<unsigned short>(10000), kToDevice, "bcd");
  EXPECT_EQ(ToDevice("int(bcd)", BytesOf(99999999)), (Bytes{0x99, 0x99, 0x99, 0x99}));
  ExpectFailure("int(bcd)", BytesOf(100000000), kToDevice, "bcd");
  ExpectFailure("int(bcd)", BytesOf(-1), kToDevice, "bcd");  // the value counts as unsigned
}

TEST(TagBaseConversionTest, BcdCodesEveryItem) {
  EXPECT_EQ(ToDevice("unsignedShort-3(bcd)", Joined<unsigned short>({1, 20, 9999})),
            (Bytes{0x01, 0x00, 0x20, 0x00, 0x99, 0x99}));
  EXPECT_EQ(ToHost("unsignedShort-3(bcd)", {0x01, 0x00, 0x20, 0x00, 0x99, 0x99}),
            Joined<unsigned short>({1, 20, 9999}));
  EXPECT_EQ(ToDevice("string-2(bcd)", {12, 34}), (Bytes{0x12, 0x34}));
  ExpectFailure("unsignedShort-2(bcd)", Joined<unsigned short>({1, 10000}), kToDevice, "bcd");
  ExpectFailure("unsignedShort-2(bcd)", {0x01, 0x00, 0x0A, 0x00}, kToHost, "bcd");
}

TEST(TagBaseConversionTest, BcdLeavesAnIncompleteItemAlone) {
  FakeTag tag("unsignedShort-1(bcd)");
  tag.length = 3;
  EXPECT_EQ(Converted(tag, {12, 0, 0xFF}, kToDevice), (Bytes{0x12, 0x00, 0xFF}));
}

TEST(TagBaseConversionTest, BcdTakesItemsOfUpToFourBytes) {
  ExpectAcceptedBy(
      "bcd", {"boolean", "byte", "short", "int", "unsignedByte", "unsignedShort", "unsignedInt",
              "float", "string-2", "binary-2", "boolean-2", "byte-2", "short-2", "int-2",
              "unsignedByte-2", "unsignedShort-2", "unsignedInt-2", "float-2"});
}

// --- neg ---

TEST(TagBaseConversionTest, NegNegatesScalars) {
  ExpectBothWays("byte(neg)", BytesOf<signed char>(5), BytesOf<signed char>(-5));
  ExpectBothWays("short(neg)", BytesOf<short>(-1234), BytesOf<short>(1234));
  ExpectBothWays("int(neg)", BytesOf(5), BytesOf(-5));
  ExpectBothWays("int64(neg)", BytesOf(5000000000LL), BytesOf(-5000000000LL));
  ExpectBothWays("float(neg)", BytesOf(1.5F), BytesOf(-1.5F));
  ExpectBothWays("double(neg)", BytesOf(-2.25), BytesOf(2.25));
}

TEST(TagBaseConversionTest, NegWraps) {
  ExpectBothWays("byte(neg)", {0x80}, {0x80});
  ExpectBothWays("short(neg)", {0x00, 0x80}, {0x00, 0x80});
  ExpectBothWays("int(neg)", BytesOf(-2147483647 - 1), BytesOf(-2147483647 - 1));
  ExpectBothWays("int(neg)", BytesOf(0), BytesOf(0));
  ExpectBothWays("int(neg)", BytesOf(256), BytesOf(-256));
}

TEST(TagBaseConversionTest, NegFlipsTheSignOfZeroAndInfinity) {
  ExpectBothWays("float(neg)", BytesOf(0.0F), BytesOf(-0.0F));
  ExpectBothWays("double(neg)", BytesOf(0.0), BytesOf(-0.0));
  // Infinity, and a number that is none with its payload.
  ExpectBothWays("float(neg)", {0x00, 0x00, 0x80, 0x7F}, {0x00, 0x00, 0x80, 0xFF});
  ExpectBothWays("float(neg)", {0x01, 0x00, 0xA0, 0x7F}, {0x01, 0x00, 0xA0, 0xFF});
}

TEST(TagBaseConversionTest, NegNegatesEveryByteOfByteArrays) {
  ExpectBothWays("byte-4(neg)", {1, 2, 0xFF, 0}, {0xFF, 0xFE, 1, 0});
  ExpectBothWays("string-2(neg)", {1, 2}, {0xFF, 0xFE});
}

TEST(TagBaseConversionTest, NegOfWideArraysStopsAtTheItemCountInBytes) {
  // Items at byte offsets 0 and 2 of four.
  ExpectBothWays("short-4(neg)", Joined<short>({1, 2, 3, 4}), Joined<short>({-1, -2, 3, 4}));
  ExpectBothWays("short-3(neg)", Joined<short>({1, 2, 3}), Joined<short>({-1, -2, 3}));
  ExpectBothWays("short-2(neg)", Joined<short>({1, 2}), Joined<short>({-1, 2}));
  ExpectBothWays("short-1(neg)", Joined<short>({1}), Joined<short>({-1}));
  // Only the first of four; the second one from five on.
  ExpectBothWays("int-4(neg)", Joined<int>({1, 2, 3, 4}), Joined<int>({-1, 2, 3, 4}));
  ExpectBothWays("int-5(neg)", Joined<int>({1, 2, 3, 4, 5}), Joined<int>({-1, -2, 3, 4, 5}));
  ExpectBothWays("float-5(neg)", Joined<float>({1, 2, 3, 4, 5}), Joined<float>({-1, -2, 3, 4, 5}));
  ExpectBothWays("int64-2(neg)", Joined<long long>({1, 2}), Joined<long long>({-1, 2}));
  ExpectBothWays("double-9(neg)", Joined<double>({1, 2, 3, 4, 5, 6, 7, 8, 9}),
                 Joined<double>({-1, -2, 3, 4, 5, 6, 7, 8, 9}));
}

TEST(TagBaseConversionTest, NegOfNoItemsSucceeds) {
  const FakeTag tag("int-0(neg)");
  unsigned char byte = 0x5A;
  EXPECT_TRUE(tag.DoConversion(&byte, "neg", kToDevice));
  EXPECT_EQ(byte, 0x5A);
}

TEST(TagBaseConversionTest, NegTakesTheSignedTypes) {
  ExpectAcceptedBy("neg", {"byte", "short", "int", "float", "double", "int64", "string-2", "byte-2",
                           "short-2", "int-2", "float-2", "double-2", "int64-2"});
  ExpectFailureBothWays("unsignedInt(neg)", "neg");
}

// --- inv ---

TEST(TagBaseConversionTest, InvTurnsBitsRound) {
  EXPECT_EQ(ToHost("boolean(inv)", {0x01}), Bytes{0});
  EXPECT_EQ(ToHost("boolean(inv)", {0x00}), Bytes{1});
  EXPECT_EQ(ToHost("boolean-3(inv)", {0x05}), (Bytes{0, 1, 0}));
  const FakeTag tag("boolean-3(inv)");
  Bytes image = {0xF8};
  const Bytes value = {0, 9, 0};
  EXPECT_TRUE(tag.Convert(value.data(), image.data(), kToDevice));
  EXPECT_EQ(image, Bytes{0xFD});
}

TEST(TagBaseConversionTest, InvComplementsNumbers) {
  ExpectBothWays("unsignedByte(inv)", {0x0F}, {0xF0});
  ExpectBothWays("unsignedShort(inv)", {0x00, 0xFF}, {0xFF, 0x00});
  ExpectBothWays("unsignedInt-2(inv)", Counting(8),
                 {0xFE, 0xFD, 0xFC, 0xFB, 0xFA, 0xF9, 0xF8, 0xF7});
  ExpectBothWays("uint64(inv)", Bytes(8, 0x55), Bytes(8, 0xAA));
  ExpectBothWays("binary-3(inv)", {1, 2, 3}, {0xFE, 0xFD, 0xFC});
}

TEST(TagBaseConversionTest, InvTakesBitsAndTheUnsignedTypes) {
  ExpectAcceptedBy(
      "inv", {"boolean", "boolean-2", "unsignedByte", "unsignedShort", "unsignedInt", "uint64",
              "binary-2", "unsignedByte-2", "unsignedShort-2", "unsignedInt-2", "uint64-2"});
  ExpectFailureBothWays("int(inv)", "inv");
}

TEST(TagBaseConversionTest, InvTakesABinaryWithoutItemType) {
  FakeTag tag;
  tag.type = ICU_BINARY;
  tag.length = 2;
  tag.SetConversions({"inv"});
  EXPECT_EQ(Converted(tag, {1, 2}, kToDevice), (Bytes{0xFE, 0xFD}));
}
