// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "protlib/TagBase.h"
#include "tests/unit/FailingNew.h"
#include "tests/unit/protlib/TagConversion.h"

namespace {

// Notes which conversions run, in which order; each succeeds but "fails".
class NotingTag final : public FakeTag {
 public:
  explicit NotingTag(const std::string& spec) : FakeTag(spec) {}
  bool DoConversion(unsigned char* /*buffer*/, const char* conversion,
                    bool toDevice) const override {
    ran += std::string(toDevice ? ">" : "<") + conversion;
    return std::string(conversion) != "fails";
  }
  mutable std::string ran;
};

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

// A tag class may say how long its image is: longer than the value, the rest of it is zero.
TEST(TagBaseTest, ImageMayBeLongerThanTheValue) {
  class Padded final : public FakeTag {
   public:
    explicit Padded(const std::string& spec) : FakeTag(spec) {}
    int PackedLen() const override { return GetVarLength() + 2; }
  };
  for (const int lengthBytes : {2, 254, 256}) {
    const Padded tag("binary-" + std::to_string(lengthBytes));
    const Bytes value(static_cast<std::size_t>(lengthBytes), 0x11);
    Bytes image = value;
    image.insert(image.end(), 2, 0);
    EXPECT_EQ(Converted(tag, value, kToDevice), image);
    image.back() = 0x22;
    EXPECT_EQ(Converted(tag, image, kToHost), value);
  }
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

TEST(TagBaseTest, ConversionsRunOnceEachAndNoneBehindAFailure) {
  const auto run = [](const std::string& list, bool toDevice) {
    const NotingTag tag("byte(" + list + ")");
    const unsigned char src = 0;
    unsigned char dst = 0;
    EXPECT_EQ(tag.Convert(&src, &dst, toDevice), list.find("fails") == std::string::npos);
    return tag.ran;
  };
  EXPECT_EQ(run("a,b,c,b", kToDevice), ">a>b>c>b");
  EXPECT_EQ(run("a,b,c,b", kToHost), "<b<c<b<a");
  EXPECT_EQ(run("a,fails,b", kToDevice), ">a>fails");
  EXPECT_EQ(run("a,fails,b", kToHost), "<b<fails");
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
