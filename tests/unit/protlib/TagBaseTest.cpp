// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "protlib/TagBase.h"
#include "tests/support/GuardedBuffer.h"
#include "tests/unit/Bytes.h"
#include "tests/unit/FailingNew.h"
#include "tests/unit/FakeTag.h"

namespace {

constexpr bool kToDevice = true;
constexpr bool kToHost = false;

// What a value becomes on its way; empty when the conversion failed, and the target untouched then.
Bytes Converted(const FakeTag& tag, const Bytes& src, bool toDevice) {
  const int room = toDevice ? tag.PackedLen() : tag.GetVarLength();
  GuardedBuffer dst(static_cast<std::size_t>(room));
  const bool done = tag.Convert(src.data(), dst.Data(), toDevice);
  EXPECT_TRUE(dst.AreGuardsIntact());
  if (!done) {
    EXPECT_TRUE(dst.IsUntouched());
    return {};
  }
  const std::string bytes = dst.Bytes();
  return Bytes(bytes.begin(), bytes.end());
}

Bytes ToDevice(const std::string& spec, const Bytes& value) {
  return Converted(FakeTag(spec), value, kToDevice);
}

Bytes ToHost(const std::string& spec, const Bytes& image) {
  return Converted(FakeTag(spec), image, kToHost);
}

// A conversion that is the same in both directions.
void ExpectBothWays(const std::string& spec, const Bytes& from, const Bytes& to) {
  EXPECT_EQ(ToDevice(spec, from), to) << spec;
  EXPECT_EQ(ToHost(spec, from), to) << spec;
}

void ExpectFailure(const std::string& spec, const Bytes& value, bool toDevice,
                   const std::string& keyword) {
  const FakeTag tag(spec);
  EXPECT_EQ(Converted(tag, value, toDevice), Bytes{}) << spec;
  EXPECT_EQ(tag.GetErrorText(), "Conversion error at: " + keyword) << spec;
}

void ExpectFailureBothWays(const std::string& spec, const std::string& keyword) {
  const Bytes value(static_cast<std::size_t>(FakeTag(spec).GetVarLength()), 0);
  ExpectFailure(spec, value, kToDevice, keyword);
  ExpectFailure(spec, value, kToHost, keyword);
}

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

TEST(TagBaseTest, MayBeReadAndWritten) {
  const FakeTag tag("int");
  EXPECT_FALSE(tag.IsReadOnly());
  EXPECT_FALSE(tag.IsWriteOnly());
}

// --- packed length ---

TEST(TagBaseTest, PackedLengthOfAnArrayIsItsLength) {
  EXPECT_EQ(FakeTag("int-4").PackedLen(), 16);
  EXPECT_EQ(FakeTag("string-20").PackedLen(), 20);
  EXPECT_EQ(FakeTag("double").PackedLen(), 8);
  EXPECT_EQ(FakeTag("string-0").PackedLen(), 0);
}

TEST(TagBaseTest, PackedLengthOfBitsCountsTheBytesTheyTouch) {
  FakeTag tag("boolean-16");
  EXPECT_EQ(tag.PackedLen(), 2);
  tag.bitIndex = 3;
  EXPECT_EQ(tag.PackedLen(), 3);
  EXPECT_EQ(FakeTag("boolean").PackedLen(), 1);
  EXPECT_EQ(FakeTag("boolean-0").PackedLen(), 1);
}

// --- without conversions ---

TEST(TagBaseTest, WithoutConversionsTheValueGoesThrough) {
  ExpectBothWays("int", {1, 2, 3, 4}, {1, 2, 3, 4});
  ExpectBothWays("string-3", {'a', 'b', 0}, {'a', 'b', 0});
  ExpectBothWays("string-0", {}, {});
}

TEST(TagBaseTest, BitsAreUnpackedTowardTheHost) {
  FakeTag tag("boolean-4");
  tag.bitIndex = 6;
  EXPECT_EQ(Converted(tag, {0x40, 0x02}, kToHost), (Bytes{1, 0, 0, 1}));
  EXPECT_EQ(ToHost("boolean", {0x01}), Bytes{1});
  EXPECT_EQ(ToHost("boolean", {0xFE}), Bytes{0});
}

TEST(TagBaseTest, BitsArePackedTowardTheDeviceAndTheOthersKept) {
  FakeTag tag("boolean-4");
  tag.bitIndex = 6;
  const Bytes value = {1, 0, 0, 7};
  Bytes image = {0x81, 0xF3};
  EXPECT_TRUE(tag.Convert(value.data(), image.data(), kToDevice));
  EXPECT_EQ(image, (Bytes{0x41, 0xF2}));
}

TEST(TagBaseTest, ConvertVariableIsConvert) {
  class Forwarded final : public FakeTag {
   public:
    Forwarded() : FakeTag("int") {}
    bool Convert(const unsigned char* src, unsigned char* dst, bool toDevice) const override {
      seenSrc = src;
      seenDst = dst;
      seenToDevice = toDevice;
      return answer;
    }
    mutable const unsigned char* seenSrc = nullptr;
    mutable unsigned char* seenDst = nullptr;
    mutable bool seenToDevice = false;
    bool answer = true;
  };
  Forwarded tag;
  const Bytes src(4);
  Bytes dst(4);
  EXPECT_TRUE(tag.ConvertVariable(src.data(), dst.data(), true));
  EXPECT_EQ(tag.seenSrc, src.data());
  EXPECT_EQ(tag.seenDst, dst.data());
  EXPECT_TRUE(tag.seenToDevice);
  tag.answer = false;
  EXPECT_FALSE(tag.ConvertVariable(src.data(), dst.data(), false));
  EXPECT_FALSE(tag.seenToDevice);
}

// --- swaps ---

TEST(TagBaseTest, SwapNibbleExchangesTheHalvesOfEachByte) {
  ExpectBothWays("unsignedByte(swapnibble)", {0x12}, {0x21});
  ExpectBothWays("string-3(swapnibble)", {0x12, 0xF0, 0xAB}, {0x21, 0x0F, 0xBA});
  ExpectBothWays("time(swapnibble)", Counting(10),
                 {0x10, 0x20, 0x30, 0x40, 0x50, 0x60, 0x70, 0x80, 0x90, 0xA0});
}

TEST(TagBaseTest, SwapNibbleTakesEveryType) { ExpectAcceptedBy("swapnibble", kAllSpecs); }

TEST(TagBaseTest, SwapsReverseTheirGroups) {
  ExpectBothWays("short(swap2)", {1, 2}, {2, 1});
  ExpectBothWays("binary-6(swap2)", {1, 2, 3, 4, 5, 6}, {2, 1, 4, 3, 6, 5});
  ExpectBothWays("int(swap4)", {1, 2, 3, 4}, {4, 3, 2, 1});
  ExpectBothWays("int-2(swap4)", Counting(8), {4, 3, 2, 1, 8, 7, 6, 5});
  ExpectBothWays("double(swap8)", Counting(8), {8, 7, 6, 5, 4, 3, 2, 1});
  ExpectBothWays("uint64-2(swap8)", Counting(16),
                 {8, 7, 6, 5, 4, 3, 2, 1, 16, 15, 14, 13, 12, 11, 10, 9});
  ExpectBothWays("double(swap2)", Counting(8), {2, 1, 4, 3, 6, 5, 8, 7});
}

TEST(TagBaseTest, SwapsFailOnAnIncompleteGroup) {
  ExpectFailureBothWays("string-3(swap2)", "swap2");
  ExpectFailureBothWays("byte(swap2)", "swap2");
  for (const int rest : {1, 2, 3}) {
    ExpectFailureBothWays("binary-" + std::to_string(4 + rest) + "(swap4)", "swap4");
  }
  for (int rest = 1; rest < 8; ++rest) {
    ExpectFailureBothWays("binary-" + std::to_string(8 + rest) + "(swap8)", "swap8");
  }
}

TEST(TagBaseTest, SwapsOfNothingSucceed) {
  for (const char* keyword : {"swap2", "swap4", "swap8"}) {
    const FakeTag tag(std::string("string-0(") + keyword + ")");
    unsigned char byte = 0x5A;
    EXPECT_TRUE(tag.DoConversion(&byte, keyword, kToDevice));
    EXPECT_EQ(byte, 0x5A);
  }
}

TEST(TagBaseTest, SwapsOfBitsSwapTheHostBytes) {
  EXPECT_EQ(ToHost("boolean-4(swap2)", {0x05}), (Bytes{0, 1, 0, 1}));
  EXPECT_EQ(ToDevice("boolean-4(swap4)", {1, 1, 0, 0}), Bytes{0x0C | (0xA5 & 0xF0)});
}

// --- bcd ---

TEST(TagBaseTest, BcdPutsTheUnitsInTheLowestNibble) {
  EXPECT_EQ(ToDevice("unsignedShort(bcd)", {0xD2, 0x04}), (Bytes{0x34, 0x12}));
  EXPECT_EQ(ToHost("unsignedShort(bcd)", {0x34, 0x12}), (Bytes{0xD2, 0x04}));
  EXPECT_EQ(ToDevice("unsignedByte(bcd)", {99}), Bytes{0x99});
  EXPECT_EQ(ToHost("unsignedByte(bcd)", {0x99}), Bytes{99});
  EXPECT_EQ(ToDevice("unsignedInt(bcd)", BytesOf(12345678U)), (Bytes{0x78, 0x56, 0x34, 0x12}));
  EXPECT_EQ(ToHost("unsignedInt(bcd)", {0x78, 0x56, 0x34, 0x12}), BytesOf(12345678U));
}

TEST(TagBaseTest, BcdGoesThereAndBackForEveryByte) {
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

TEST(TagBaseTest, BcdFailsOnEveryNibbleAboveNine) {
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

TEST(TagBaseTest, BcdHasALargestValueForEachLength) {
  ExpectFailure("unsignedByte(bcd)", {100}, kToDevice, "bcd");
  EXPECT_EQ(ToDevice("unsignedShort(bcd)", BytesOf<unsigned short>(9999)), (Bytes{0x99, 0x99}));
  ExpectFailure("unsignedShort(bcd)", BytesOf<unsigned short>(10000), kToDevice, "bcd");
  EXPECT_EQ(ToDevice("int(bcd)", BytesOf(99999999)), (Bytes{0x99, 0x99, 0x99, 0x99}));
  ExpectFailure("int(bcd)", BytesOf(100000000), kToDevice, "bcd");
  ExpectFailure("int(bcd)", BytesOf(-1), kToDevice, "bcd");  // the value counts as unsigned
}

TEST(TagBaseTest, BcdCodesEveryItem) {
  EXPECT_EQ(ToDevice("unsignedShort-3(bcd)", Joined<unsigned short>({1, 20, 9999})),
            (Bytes{0x01, 0x00, 0x20, 0x00, 0x99, 0x99}));
  EXPECT_EQ(ToHost("unsignedShort-3(bcd)", {0x01, 0x00, 0x20, 0x00, 0x99, 0x99}),
            Joined<unsigned short>({1, 20, 9999}));
  EXPECT_EQ(ToDevice("string-2(bcd)", {12, 34}), (Bytes{0x12, 0x34}));
  ExpectFailure("unsignedShort-2(bcd)", Joined<unsigned short>({1, 10000}), kToDevice, "bcd");
  ExpectFailure("unsignedShort-2(bcd)", {0x01, 0x00, 0x0A, 0x00}, kToHost, "bcd");
}

TEST(TagBaseTest, BcdLeavesAnIncompleteItemAlone) {
  FakeTag tag("unsignedShort-1(bcd)");
  tag.length = 3;
  EXPECT_EQ(Converted(tag, {12, 0, 0xFF}, kToDevice), (Bytes{0x12, 0x00, 0xFF}));
}

TEST(TagBaseTest, BcdTakesItemsOfUpToFourBytes) {
  ExpectAcceptedBy(
      "bcd", {"boolean", "byte", "short", "int", "unsignedByte", "unsignedShort", "unsignedInt",
              "float", "string-2", "binary-2", "boolean-2", "byte-2", "short-2", "int-2",
              "unsignedByte-2", "unsignedShort-2", "unsignedInt-2", "float-2"});
}

// --- neg ---

TEST(TagBaseTest, NegNegatesScalars) {
  ExpectBothWays("byte(neg)", BytesOf<signed char>(5), BytesOf<signed char>(-5));
  ExpectBothWays("short(neg)", BytesOf<short>(-1234), BytesOf<short>(1234));
  ExpectBothWays("int(neg)", BytesOf(5), BytesOf(-5));
  ExpectBothWays("int64(neg)", BytesOf(5000000000LL), BytesOf(-5000000000LL));
  ExpectBothWays("float(neg)", BytesOf(1.5F), BytesOf(-1.5F));
  ExpectBothWays("double(neg)", BytesOf(-2.25), BytesOf(2.25));
}

TEST(TagBaseTest, NegWraps) {
  ExpectBothWays("byte(neg)", {0x80}, {0x80});
  ExpectBothWays("short(neg)", {0x00, 0x80}, {0x00, 0x80});
  ExpectBothWays("int(neg)", BytesOf(-2147483647 - 1), BytesOf(-2147483647 - 1));
  ExpectBothWays("int(neg)", BytesOf(0), BytesOf(0));
  ExpectBothWays("int(neg)", BytesOf(256), BytesOf(-256));
}

TEST(TagBaseTest, NegFlipsTheSignOfZeroAndInfinity) {
  ExpectBothWays("float(neg)", BytesOf(0.0F), BytesOf(-0.0F));
  ExpectBothWays("double(neg)", BytesOf(0.0), BytesOf(-0.0));
  // Infinity, and a number that is none with its payload.
  ExpectBothWays("float(neg)", {0x00, 0x00, 0x80, 0x7F}, {0x00, 0x00, 0x80, 0xFF});
  ExpectBothWays("float(neg)", {0x01, 0x00, 0xA0, 0x7F}, {0x01, 0x00, 0xA0, 0xFF});
}

TEST(TagBaseTest, NegNegatesEveryByteOfByteArrays) {
  ExpectBothWays("byte-4(neg)", {1, 2, 0xFF, 0}, {0xFF, 0xFE, 1, 0});
  ExpectBothWays("string-2(neg)", {1, 2}, {0xFF, 0xFE});
}

TEST(TagBaseTest, NegOfWideArraysStopsAtTheItemCountInBytes) {
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

TEST(TagBaseTest, NegOfNoItemsSucceeds) {
  const FakeTag tag("int-0(neg)");
  unsigned char byte = 0x5A;
  EXPECT_TRUE(tag.DoConversion(&byte, "neg", kToDevice));
  EXPECT_EQ(byte, 0x5A);
}

TEST(TagBaseTest, NegTakesTheSignedTypes) {
  ExpectAcceptedBy("neg", {"byte", "short", "int", "float", "double", "int64", "string-2", "byte-2",
                           "short-2", "int-2", "float-2", "double-2", "int64-2"});
  ExpectFailureBothWays("unsignedInt(neg)", "neg");
}

// --- inv ---

TEST(TagBaseTest, InvTurnsBitsRound) {
  EXPECT_EQ(ToHost("boolean(inv)", {0x01}), Bytes{0});
  EXPECT_EQ(ToHost("boolean(inv)", {0x00}), Bytes{1});
  EXPECT_EQ(ToHost("boolean-3(inv)", {0x05}), (Bytes{0, 1, 0}));
  const FakeTag tag("boolean-3(inv)");
  Bytes image = {0xF8};
  const Bytes value = {0, 9, 0};
  EXPECT_TRUE(tag.Convert(value.data(), image.data(), kToDevice));
  EXPECT_EQ(image, Bytes{0xFD});
}

TEST(TagBaseTest, InvComplementsNumbers) {
  ExpectBothWays("unsignedByte(inv)", {0x0F}, {0xF0});
  ExpectBothWays("unsignedShort(inv)", {0x00, 0xFF}, {0xFF, 0x00});
  ExpectBothWays("unsignedInt-2(inv)", Counting(8),
                 {0xFE, 0xFD, 0xFC, 0xFB, 0xFA, 0xF9, 0xF8, 0xF7});
  ExpectBothWays("uint64(inv)", Bytes(8, 0x55), Bytes(8, 0xAA));
  ExpectBothWays("binary-3(inv)", {1, 2, 3}, {0xFE, 0xFD, 0xFC});
}

TEST(TagBaseTest, InvTakesBitsAndTheUnsignedTypes) {
  ExpectAcceptedBy(
      "inv", {"boolean", "boolean-2", "unsignedByte", "unsignedShort", "unsignedInt", "uint64",
              "binary-2", "unsignedByte-2", "unsignedShort-2", "unsignedInt-2", "uint64-2"});
  ExpectFailureBothWays("int(inv)", "inv");
}

TEST(TagBaseTest, InvTakesABinaryWithoutItemType) {
  FakeTag tag;
  tag.type = ICU_BINARY;
  tag.length = 2;
  tag.SetConversions({"inv"});
  EXPECT_EQ(Converted(tag, {1, 2}, kToDevice), (Bytes{0xFE, 0xFD}));
}

// --- keywords, order, failure ---

TEST(TagBaseTest, UnknownConversionsFail) {
  for (const std::string keyword : {"", "Swap2", "SWAP2", "swap2 x", "swap16", "negate", "none"}) {
    ExpectFailureBothWays("int(" + keyword + ")", keyword);
  }
}

TEST(TagBaseTest, ConversionsRunForwardToTheDeviceAndBackwardToTheHost) {
  // 256 swapped is 1, negated is -1; the other way round it were 0x00FF.
  EXPECT_EQ(ToDevice("short(swap2,neg)", BytesOf<short>(256)), BytesOf<short>(-1));
  EXPECT_EQ(ToHost("short(swap2,neg)", BytesOf<short>(-1)), BytesOf<short>(256));
  EXPECT_EQ(ToHost("short(swap2,neg)", BytesOf<short>(256)), (Bytes{0xFF, 0x00}));
}

TEST(TagBaseTest, ReadingUndoesWriting) {
  const std::vector<std::string> specs = {"short(swap2,neg)",         "int(swap4,neg,swapnibble)",
                                          "unsignedShort(bcd,swap2)", "unsignedInt(bcd,swap4)",
                                          "uint64(swap8,inv)",        "boolean-8(inv,swap2)",
                                          "double(neg,swap8)"};
  for (const std::string& spec : specs) {
    const FakeTag tag(spec);
    for (int seed = 0; seed < 2; ++seed) {
      Bytes value(static_cast<std::size_t>(tag.GetVarLength()), 0);
      value[0] = static_cast<unsigned char>(seed);
      EXPECT_EQ(Converted(tag, Converted(tag, value, kToDevice), kToHost), value) << spec;
    }
  }
}

TEST(TagBaseTest, FirstFailureStopsAndIsNamed) {
  ExpectFailure("int(swap4,first,second)", BytesOf(1), kToDevice, "first");
  ExpectFailure("int(first,second,swap4)", BytesOf(1), kToHost, "second");
}

TEST(TagBaseTest, FailedConversionLeavesEarlierOnesWithoutEffect) {
  // swap4 has run before neg fails; the target shows nothing of it.
  ExpectFailure("unsignedInt(swap4,neg)", BytesOf(1), kToDevice, "neg");
}

TEST(TagBaseTest, ErrorTextStaysUntilTheNextOne) {
  FakeTag tag("int(wrong)");
  EXPECT_EQ(tag.GetErrorText(), "");
  const Bytes src(4);
  Bytes dst(4);
  EXPECT_FALSE(tag.Convert(src.data(), dst.data(), kToHost));
  tag.SetConversions({});
  EXPECT_TRUE(tag.Convert(src.data(), dst.data(), kToHost));
  EXPECT_EQ(tag.GetErrorText(), "Conversion error at: wrong");
  tag.SetError("another");
  EXPECT_EQ(tag.GetErrorText(), "another");
}

TEST(TagBaseTest, DoConversionByItselfLeavesNoText) {
  const FakeTag tag("int");
  Bytes buffer(4);
  EXPECT_FALSE(tag.DoConversion(buffer.data(), "wrong", kToDevice));
  EXPECT_EQ(tag.GetErrorText(), "");
}

TEST(TagBaseTest, OverriddenConversionIsUsed) {
  class OwnConversion final : public FakeTag {
   public:
    OwnConversion() : FakeTag("byte(own)") {}
    bool DoConversion(unsigned char* buffer, const char* conversion, bool toDevice) const override {
      buffer[0] = toDevice ? 1 : 2;
      return std::string(conversion) == "own";
    }
  };
  const OwnConversion tag;
  EXPECT_EQ(Converted(tag, {0}, kToDevice), Bytes{1});
  EXPECT_EQ(Converted(tag, {0}, kToHost), Bytes{2});
}

TEST(TagBaseTest, NullAndNegativeFailCleanly) {
  FakeTag tag("int(swap4)");
  Bytes buffer = {1, 2, 3, 4};
  EXPECT_FALSE(tag.Convert(nullptr, buffer.data(), kToHost));
  EXPECT_FALSE(tag.Convert(buffer.data(), nullptr, kToHost));
  EXPECT_FALSE(tag.DoConversion(nullptr, "swap4", kToHost));
  EXPECT_FALSE(tag.DoConversion(buffer.data(), nullptr, kToHost));
  tag.length = -4;
  EXPECT_FALSE(tag.Convert(buffer.data(), buffer.data(), kToHost));
  EXPECT_FALSE(tag.DoConversion(buffer.data(), "swap4", kToHost));
  EXPECT_EQ(buffer, (Bytes{1, 2, 3, 4}));
}

// --- memory ---

TEST(TagBaseTest, AllocatesOnlyAbove256Bytes) {
  const auto allocations = [](int lengthBytes) {
    FakeTag tag("binary-1(swapnibble)");
    tag.length = lengthBytes;
    const Bytes src(static_cast<std::size_t>(lengthBytes));
    Bytes dst(static_cast<std::size_t>(lengthBytes));
    const long long before = FailingNew::Count();
    EXPECT_TRUE(tag.Convert(src.data(), dst.data(), kToHost));
    EXPECT_TRUE(tag.Convert(src.data(), dst.data(), kToDevice));
    return FailingNew::Count() - before;
  };
  EXPECT_EQ(allocations(256), 0);
  EXPECT_EQ(allocations(257), 2);
}

TEST(TagBaseTest, LargeValuesAreConvertedWhole) {
  const int lengthBytes = 20000;
  Bytes src(static_cast<std::size_t>(lengthBytes));
  Bytes expected(src.size());
  for (std::size_t i = 0; i < src.size(); ++i) {
    src[i] = static_cast<unsigned char>(i);
    expected[i ^ 1U] = src[i];
  }
  ExpectBothWays("binary-20000(swap2)", src, expected);
}

TEST(TagBaseTest, ManyBitsNeedMoreRoomThanTheirImage) {
  Bytes image(64, 0xFF);
  EXPECT_EQ(ToHost("boolean-512", image), Bytes(512, 1));
  EXPECT_EQ(ToDevice("boolean-512", Bytes(512, 1)), image);
}

TEST(TagBaseTest, WithoutMemoryTheConversionFails) {
  const FakeTag tag("binary-257");
  const Bytes src(257);
  Bytes dst(257, 0x5A);
  const FailingNew noMemory(1);
  EXPECT_FALSE(tag.Convert(src.data(), dst.data(), kToHost));
  EXPECT_TRUE(noMemory.HasFailed());
  EXPECT_EQ(dst[0], 0x5A);
}

TEST(TagBaseTest, WithoutMemoryForTheErrorTextItSaysSo) {
  const FakeTag tag("int");
  const std::string text(200, 'x');
  {
    const FailingNew noMemory(1);
    tag.SetError(text.c_str());
  }
  EXPECT_EQ(tag.GetErrorText(), "Out of memory");
}

TEST(TagBaseTest, FailureWithoutMemoryForItsTextDoesNotEscape) {
  const FakeTag tag("int(a-conversion-that-nobody-knows)");
  const Bytes src(4);
  Bytes dst(4, 0x5A);
  for (int nth = 1; nth < 4; ++nth) {
    const FailingNew noMemory(nth);
    EXPECT_FALSE(tag.Convert(src.data(), dst.data(), kToHost)) << nth;
  }
  EXPECT_EQ(dst, Bytes(4, 0x5A));
}

TEST(TagBaseTest, CopyHasItsOwnConversionsAndText) {
  FakeTag tag("int(swap4)");
  tag.SetError("text");
  const FakeTag copy(tag);
  tag.SetConversions({});
  tag.SetError("later");
  EXPECT_EQ(copy.Conversions(), std::vector<std::string>{"swap4"});
  EXPECT_EQ(copy.GetErrorText(), "text");
}
