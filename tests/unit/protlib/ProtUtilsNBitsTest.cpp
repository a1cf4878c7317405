// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <random>
#include <vector>

#include "protlib/ProtUtilsN.h"
#include "tests/unit/Bytes.h"
#include "tests/unit/FakeTag.h"

namespace {

// The obvious model: an area as a list of bits, lowest bit of the first byte first.
using Bits = std::vector<bool>;

Bits BitsOf(const Bytes& bytes) {
  Bits bits;
  for (const unsigned char byte : bytes) {
    for (unsigned int i = 0; i < 8; ++i) bits.push_back((byte >> i) % 2 == 1);
  }
  return bits;
}

class RandomArea {
 public:
  static constexpr int kAreaBytes = 9;
  static constexpr int kAreaBits = 8 * kAreaBytes;

  Bytes Area() {
    Bytes bytes(kAreaBytes);
    for (unsigned char& byte : bytes) byte = static_cast<unsigned char>(Below(256));
    return bytes;
  }
  int Below(int end) { return static_cast<int>(random_() % static_cast<unsigned int>(end)); }

 private:
  std::mt19937 random_{20240229};
};

constexpr int kRandomRuns = 5000;

Bytes Unpacked(const Bytes& src, int startBit, int bitCount) {
  Bytes dst(static_cast<std::size_t>(bitCount > 0 ? bitCount : 0), 0xEE);
  ProtUtilsN::UnpackBits(dst.data(), src.data(), startBit, bitCount);
  return dst;
}

}  // namespace

TEST(ProtUtilsNBitsTest, LengthOfRuns) {
  EXPECT_EQ(ProtUtilsN::GetLenOfBits(0, 1), 1);
  EXPECT_EQ(ProtUtilsN::GetLenOfBits(7, 2), 2);
  EXPECT_EQ(ProtUtilsN::GetLenOfBits(3, 16), 3);
  EXPECT_EQ(ProtUtilsN::GetLenOfBits(0, 8), 1);
  EXPECT_EQ(ProtUtilsN::GetLenOfBits(0, 9), 2);
  EXPECT_EQ(ProtUtilsN::GetLenOfBits(0, 0), 1);  // an empty run still counts a byte
  EXPECT_EQ(ProtUtilsN::GetLenOfBits(8, 0), 0);  // (8 - 1) / 8 - 8 / 8 + 1
  EXPECT_EQ(ProtUtilsN::GetLenOfBits(9, 0), 1);
}

TEST(ProtUtilsNBitsTest, LengthOfRunsFollowsTheFormula) {
  for (int start = 0; start < 40; ++start) {
    for (int count = 0; count < 40; ++count) {
      EXPECT_EQ(ProtUtilsN::GetLenOfBits(start, count), (start + count - 1) / 8 - start / 8 + 1);
    }
  }
  EXPECT_EQ(ProtUtilsN::GetLenOfBits(0, 2147483647), 268435456);
}

TEST(ProtUtilsNBitsTest, UnpackExample) { EXPECT_EQ(Unpacked({0x05}, 0, 3), (Bytes{1, 0, 1})); }

TEST(ProtUtilsNBitsTest, PackExample) {
  Bytes dst = {0, 0};
  const Bytes ones = {1, 1};
  ProtUtilsN::PackBits(dst.data(), ones.data(), 7, 2);
  EXPECT_EQ(dst, (Bytes{0x80, 0x01}));
}

TEST(ProtUtilsNBitsTest, PackKeepsTheOtherBitsAndClears) {
  Bytes dst = {0xFF, 0xFF};
  const Bytes bits = {0, 1, 0};
  ProtUtilsN::PackBits(dst.data(), bits.data(), 6, 3);
  EXPECT_EQ(dst, (Bytes{0xBF, 0xFE}));
}

TEST(ProtUtilsNBitsTest, EveryNonZeroByteIsASetBit) {
  for (int value = 0; value < 256; ++value) {
    const auto byte = static_cast<unsigned char>(value);
    unsigned char dst = 0;
    ProtUtilsN::PackBits(&dst, &byte, 3, 1);
    EXPECT_EQ(dst, value == 0 ? 0x00 : 0x08) << value;
  }
}

TEST(ProtUtilsNBitsTest, ShiftExampleSpansTwoBytes) {
  const Bytes src = {0x1E};  // bits 1 to 4 are set
  Bytes dst = {0, 0};
  ProtUtilsN::shiftBits(dst.data(), 6, src.data(), 1, 4);
  EXPECT_EQ(dst, (Bytes{0xC0, 0x03}));
}

TEST(ProtUtilsNBitsTest, CopyKeepsThePlaceWithinTheByte) {
  const Bytes src = {0x00, 0xF0, 0x0F};
  Bytes dst = {0xAA, 0xAA, 0xAA};
  ProtUtilsN::CopyBits(dst.data(), src.data(), 12, 8);  // bit 12 is bit 4 of the second byte
  EXPECT_EQ(dst, (Bytes{0xFA, 0xAF, 0xAA}));
}

TEST(ProtUtilsNBitsTest, CountOfZeroOrLessCopiesNothing) {
  const Bytes src = {0xFF, 0xFF};
  for (const int count : {0, -1, -2147483647 - 1}) {
    Bytes dst = {0x5A, 0x5A};
    ProtUtilsN::UnpackBits(dst.data(), src.data(), 0, count);
    ProtUtilsN::PackBits(dst.data(), src.data(), 0, count);
    ProtUtilsN::CopyBits(dst.data(), src.data(), 0, count);
    ProtUtilsN::shiftBits(dst.data(), 0, src.data(), 0, count);
    EXPECT_EQ(dst, (Bytes{0x5A, 0x5A})) << count;
  }
}

TEST(ProtUtilsNBitsTest, UnpackAgreesWithTheModel) {
  RandomArea random;
  for (int run = 0; run < kRandomRuns; ++run) {
    const Bytes src = random.Area();
    const Bits bits = BitsOf(src);
    const int start = random.Below(RandomArea::kAreaBits);
    const int count = random.Below(RandomArea::kAreaBits - start + 1);
    Bytes expected;
    for (int i = 0; i < count; ++i) {
      expected.push_back(bits[static_cast<std::size_t>(start + i)] ? 1 : 0);
    }
    ASSERT_EQ(Unpacked(src, start, count), expected) << "start " << start << " count " << count;
  }
}

TEST(ProtUtilsNBitsTest, PackAgreesWithTheModel) {
  RandomArea random;
  for (int run = 0; run < kRandomRuns; ++run) {
    Bytes dst = random.Area();
    Bits expected = BitsOf(dst);
    const int start = random.Below(RandomArea::kAreaBits);
    const int count = random.Below(RandomArea::kAreaBits - start + 1);
    Bytes src;
    for (int i = 0; i < count; ++i) {
      src.push_back(static_cast<unsigned char>(random.Below(3)));
      expected[static_cast<std::size_t>(start + i)] = src.back() != 0;
    }
    ProtUtilsN::PackBits(dst.data(), src.data(), start, count);
    ASSERT_EQ(BitsOf(dst), expected) << "start " << start << " count " << count;
  }
}

TEST(ProtUtilsNBitsTest, CopyAgreesWithTheModel) {
  RandomArea random;
  for (int run = 0; run < kRandomRuns; ++run) {
    const Bytes src = random.Area();
    const Bits bits = BitsOf(src);
    Bytes dst = random.Area();
    Bits expected = BitsOf(dst);
    const int start = random.Below(RandomArea::kAreaBits);
    const int count = random.Below(RandomArea::kAreaBits - start + 1);
    for (int i = 0; i < count; ++i) {
      expected[static_cast<std::size_t>(start % 8 + i)] = bits[static_cast<std::size_t>(start + i)];
    }
    ProtUtilsN::CopyBits(dst.data(), src.data(), start, count);
    ASSERT_EQ(BitsOf(dst), expected) << "start " << start << " count " << count;
  }
}

TEST(ProtUtilsNBitsTest, ShiftAgreesWithTheModel) {
  RandomArea random;
  for (int run = 0; run < kRandomRuns; ++run) {
    const Bytes src = random.Area();
    const Bits bits = BitsOf(src);
    Bytes dst = random.Area();
    Bits expected = BitsOf(dst);
    const int from = random.Below(RandomArea::kAreaBits);
    const int to = random.Below(RandomArea::kAreaBits);
    const int count = random.Below(RandomArea::kAreaBits - (from > to ? from : to) + 1);
    for (int i = 0; i < count; ++i) {
      expected[static_cast<std::size_t>(to + i)] = bits[static_cast<std::size_t>(from + i)];
    }
    ProtUtilsN::shiftBits(dst.data(), to, src.data(), from, count);
    ASSERT_EQ(BitsOf(dst), expected) << "from " << from << " to " << to << " count " << count;
  }
}

TEST(ProtUtilsNBitsTest, ShiftGoesInAscendingOrder) {
  Bytes area = {0x01, 0x00};
  // Each copied bit is the source of the next one.
  ProtUtilsN::shiftBits(area.data(), 1, area.data(), 0, 15);
  EXPECT_EQ(area, (Bytes{0xFF, 0xFF}));
}

// --- bits of tags ---

TEST(ProtUtilsNBitsTest, BitTagBeginsAtItsBit) {
  FakeTag tag("boolean-5");
  tag.byteOffset = 3;
  tag.bitIndex = 6;
  EXPECT_EQ(ProtUtilsN::getStartingBit(&tag), 30);
  EXPECT_EQ(ProtUtilsN::getEndingBit(&tag), 35);
}

TEST(ProtUtilsNBitsTest, OtherTagBeginsAtItsByte) {
  FakeTag tag("int-2");
  tag.byteOffset = 3;
  tag.bitIndex = 6;  // of no account
  EXPECT_EQ(ProtUtilsN::getStartingBit(&tag), 24);
  EXPECT_EQ(ProtUtilsN::getEndingBit(&tag), 24 + 64);
}

TEST(ProtUtilsNBitsTest, HugeOffsetsWrap) {
  FakeTag tag("byte");
  tag.byteOffset = 0x20000001U;
  EXPECT_EQ(ProtUtilsN::getStartingBit(&tag), 8);
  EXPECT_EQ(ProtUtilsN::getEndingBit(&tag), 16);
}
