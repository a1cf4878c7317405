// SPDX-License-Identifier: Apache-2.0
// Value conversions, asked of the tag itself and seen through reads and writes.
#include <cstring>

#include "tests/plugin/PluginFixture.h"
#include "tests/support/HexDump.h"

namespace {

using std::string_literals::operator""s;

class ConversionTest : public ProtocolFixture {
 protected:
  void SetUp() override {
    ProtocolFixture::SetUp();
    ASSERT_TRUE(P().Config(Mandatory()));
  }
  // The converted bytes, or "failed" when the conversion failed and left the destination alone.
  std::string Convert(const std::string& uri, const std::string& value, bool toDevice) {
    const ITag* tag = P().Tag("0?" + uri);
    EXPECT_NE(tag, nullptr) << uri;
    std::string results[2];
    for (const bool byOtherName : {false, true}) {
      GuardedBuffer buffer(static_cast<std::size_t>(tag->GetVarLength()));
      const auto* src = reinterpret_cast<const unsigned char*>(value.data());
      const bool success = byOtherName ? tag->ConvertVariable(src, buffer.Data(), toDevice)
                                       : tag->Convert(src, buffer.Data(), toDevice);
      EXPECT_TRUE(buffer.AreGuardsIntact()) << uri;
      std::string& result = results[byOtherName ? 1 : 0];
      result = success ? buffer.Bytes() : (buffer.IsUntouched() ? "failed" : "failed, but wrote");
    }
    EXPECT_EQ(results[0], results[1]) << uri;
    return results[0];
  }
  std::string ToDevice(const std::string& uri, const std::string& value) {
    return Convert(uri, value, true);
  }
  std::string ToHost(const std::string& uri, const std::string& value) {
    return Convert(uri, value, false);
  }
};

TEST_F(ConversionTest, WithoutConversionsValuesPass) {
  EXPECT_EQ(ToDevice("SP_Baud?unsignedInt", "\1\2\3\4"), "\1\2\3\4");
  EXPECT_EQ(ToHost("SP_Baud?unsignedInt", "\1\2\3\4"), "\1\2\3\4");
  EXPECT_EQ(ToDevice("tx_token?string-5", "AB\0CD"s), "AB\0CD"s);
  EXPECT_EQ(ToHost("SP_Par?unsignedByte", "\xFF"), "\xFF");
}

TEST_F(ConversionTest, ABooleanIsOneBit) {
  EXPECT_EQ(ToHost("connect?boolean", "\1"), "\1"s);
  EXPECT_EQ(ToHost("connect?boolean", "\xFE"), "\0"s);
  EXPECT_EQ(ToHost("connect?boolean", "\xFF"), "\1"s);
  // Toward the device only that bit is written; the fill of the buffer is A5.
  EXPECT_EQ(ToDevice("connect?boolean", "\0"s), "\xA4");
  EXPECT_EQ(ToDevice("connect?boolean", "\1"s), "\xA5");
  EXPECT_EQ(ToDevice("connect?boolean", "\x80"s), "\xA5");
}

TEST_F(ConversionTest, Swaps) {
  EXPECT_EQ(ToDevice("tx_token?string-4(swap2)", "ABCD"), "BADC");
  EXPECT_EQ(ToHost("tx_token?string-4(swap2)", "ABCD"), "BADC");
  EXPECT_EQ(ToDevice("tx_token?string-8(swap4)", "ABCDEFGH"), "DCBAHGFE");
  EXPECT_EQ(ToDevice("tx_token?string-8(swap8)", "ABCDEFGH"), "HGFEDCBA");
  EXPECT_EQ(ToDevice("tx_token?string-16(swap8)", "ABCDEFGHIJKLMNOP"), "HGFEDCBAPONMLKJI");
  EXPECT_EQ(ToDevice("SP_Baud?unsignedInt(swap2)", "\1\2\3\4"), "\2\1\4\3");
  EXPECT_EQ(ToDevice("SP_Baud?unsignedInt(swap4)", "\1\2\3\4"), "\4\3\2\1");
  EXPECT_EQ(ToDevice("tx_token?string-0(swap8)", ""), "");
}

TEST_F(ConversionTest, SwapsOfPartialGroupsFail) {
  EXPECT_EQ(ToDevice("tx_token?string-3(swap2)", "ABC"), "failed");
  EXPECT_EQ(ToHost("tx_token?string-3(swap2)", "ABC"), "failed");
  EXPECT_EQ(ToDevice("tx_token?string-6(swap4)", "ABCDEF"), "failed");
  EXPECT_EQ(ToDevice("tx_token?string-12(swap8)", "ABCDEFGHIJKL"), "failed");
  EXPECT_EQ(ToDevice("SP_Baud?unsignedInt(swap8)", "\1\2\3\4"), "failed");
  EXPECT_EQ(ToDevice("SP_Par?unsignedByte(swap2)", "\1"), "failed");
  EXPECT_EQ(ToDevice("connect?boolean(swap2)", "\1"), "failed");
}

TEST_F(ConversionTest, SwapNibble) {
  EXPECT_EQ(ToDevice("SP_Par?unsignedByte(swapnibble)", "\x1F"), "\xF1");
  EXPECT_EQ(ToHost("SP_Baud?unsignedInt(swapnibble)", "\x12\x34\xAB\xF0"), "\x21\x43\xBA\x0F");
  EXPECT_EQ(ToDevice("tx_token?string-3(swapnibble)", "ABC"), "\x14\x24\x34");
}

TEST_F(ConversionTest, BcdOfOneByte) {
  for (int value = 0; value < 256; ++value) {
    const std::string byte(1, static_cast<char>(static_cast<unsigned char>(value)));
    const int coded = value / 10 * 16 + value % 10;
    const std::string expected =
        value > 99 ? "failed"
                   : std::string(1, static_cast<char>(static_cast<unsigned char>(coded)));
    EXPECT_EQ(ToDevice("SP_Par?unsignedByte(bcd)", byte), expected) << value;

    const int high = value / 16;
    const int low = value % 16;
    const std::string decoded =
        high > 9 || low > 9
            ? "failed"
            : std::string(1, static_cast<char>(static_cast<unsigned char>(high * 10 + low)));
    EXPECT_EQ(ToHost("SP_Par?unsignedByte(bcd)", byte), decoded) << value;
  }
}

TEST_F(ConversionTest, BcdOfFourBytes) {
  const struct {
    unsigned value;
    const char* device;
  } rows[] = {{0, "00 00 00 00"},        {9, "09 00 00 00"},        {1234, "34 12 00 00"},
              {12345678, "78 56 34 12"}, {99999999, "99 99 99 99"}, {100, "00 01 00 00"}};
  for (const auto& row : rows) {
    std::string bytes(4, '\0');
    std::memcpy(bytes.data(), &row.value, 4);
    const std::string device = ToDevice("SP_Baud?unsignedInt(bcd)", bytes);
    EXPECT_EQ(HexDump(device), row.device);
    EXPECT_EQ(ToHost("SP_Baud?unsignedInt(bcd)", device), bytes);
  }
  EXPECT_EQ(ToDevice("SP_Baud?unsignedInt(bcd)", "\x00\xE1\xF5\x05"s), "failed") << "100000000";
  EXPECT_EQ(ToDevice("SP_Baud?unsignedInt(bcd)", "\xFF\xFF\xFF\xFF"), "failed");
  EXPECT_EQ(ToHost("SP_Baud?unsignedInt(bcd)", "\x3A\0\0\0"s), "failed");
  EXPECT_EQ(ToHost("SP_Baud?unsignedInt(bcd)", "\0\0\0\xA0"s), "failed");
}

TEST_F(ConversionTest, BcdOfEveryItem) {
  EXPECT_EQ(ToDevice("tx_token?string-3(bcd)", "\x0A\x63\x00"s), "\x10\x99\x00"s);
  EXPECT_EQ(ToDevice("tx_token?string-3(bcd)", "\x0A\x64\x00"s), "failed");
  EXPECT_EQ(ToHost("tx_token?string-3(bcd)", "\x10\x99\x00"s), "\x0A\x63\x00"s);
}

TEST_F(ConversionTest, NegOfBytes) {
  EXPECT_EQ(ToDevice("tx_token?string-4(neg)", "\x01\xFF\x80\x00"s), "\xFF\x01\x80\x00"s);
  EXPECT_EQ(ToHost("tx_token?string-4(neg)", "\xFF\x01\x80\x00"s), "\x01\xFF\x80\x00"s);
}

TEST_F(ConversionTest, NegOfUnsignedTypesFails) {
  EXPECT_EQ(ToDevice("SP_Baud?unsignedInt(neg)", "\1\0\0\0"s), "failed");
  EXPECT_EQ(ToDevice("SP_Par?unsignedByte(neg)", "\1"s), "failed");
  EXPECT_EQ(ToDevice("connect?boolean(neg)", "\1"s), "failed");
}

TEST_F(ConversionTest, Inv) {
  EXPECT_EQ(ToDevice("SP_Par?unsignedByte(inv)", "\x0F"), "\xF0");
  EXPECT_EQ(ToHost("SP_Baud?unsignedInt(inv)", "\x0F\xFF\x00\xA5"s), "\xF0\x00\xFF\x5A"s);
  EXPECT_EQ(ToHost("connect?boolean(inv)", "\1"), "\0"s);
  EXPECT_EQ(ToHost("connect?boolean(inv)", "\0"s), "\1"s);
  EXPECT_EQ(ToDevice("connect?boolean(inv)", "\1"), "\xA4");
  EXPECT_EQ(ToDevice("connect?boolean(inv)", "\0"s), "\xA5");
  EXPECT_EQ(ToDevice("connect?boolean(inv)", "\x80"), "\xA4");
  EXPECT_EQ(ToDevice("tx_token?string-2(inv)", "AB"), "failed") << "characters are signed bytes";
}

TEST_F(ConversionTest, UnknownConversionsFail) {
  for (const char* word : {"nosuch", "", "Swap2", "swap2 x", "bcd2", "swap", "NEG", "a b"}) {
    EXPECT_EQ(ToDevice(std::string("SP_Baud?unsignedInt(") + word + ")", "\1\2\3\4"), "failed");
    EXPECT_EQ(ToHost(std::string("SP_Baud?unsignedInt(") + word + ")", "\1\2\3\4"), "failed");
  }
  EXPECT_EQ(ToDevice("SP_Baud?unsignedInt(swap2,)", "\1\2\3\4"), "failed");
  EXPECT_EQ(ToDevice("SP_Baud?unsignedInt(swap2,nosuch)", "\1\2\3\4"), "failed");
}

TEST_F(ConversionTest, SeveralConversionsAreUndoneInReverse) {
  // 12 is coded 12 hex, then its nibbles are exchanged.
  EXPECT_EQ(ToDevice("SP_Par?unsignedByte(bcd,swapnibble)", "\x0C"), "\x21");
  EXPECT_EQ(ToHost("SP_Par?unsignedByte(bcd,swapnibble)", "\x21"), "\x0C");
  // The other way round the nibbles of 12 (0C) become C0, which is no value below 100.
  EXPECT_EQ(ToDevice("SP_Par?unsignedByte(swapnibble,bcd)", "\x0C"), "failed");
  EXPECT_EQ(ToDevice("tx_token?string-4( swap2 , swap4 )", "ABCD"), "CDAB");
  EXPECT_EQ(ToHost("tx_token?string-4(swap2,swap4)", "CDAB"), "ABCD");
}

TEST_F(ConversionTest, ValuesBeyondTheStackBuffer) {
  for (const int length : {254, 256, 258, 5000}) {
    std::string value;
    while (value.size() < static_cast<std::size_t>(length)) value += "AB";
    std::string swapped;
    while (swapped.size() < static_cast<std::size_t>(length)) swapped += "BA";
    EXPECT_EQ(ToDevice("tx_token?string-" + std::to_string(length) + "(swap2)", value), swapped);
    EXPECT_EQ(ToHost("tx_token?string-" + std::to_string(length) + "(swap2)", swapped), value);
  }
}

TEST_F(ConversionTest, OneConversionInPlace) {
  const ITag* tag = P().Tag("0?SP_Baud?unsignedInt");
  const auto apply = [tag](const char* conversion, std::string bytes, bool toDevice) {
    GuardedBuffer buffer(bytes.size());
    std::memcpy(buffer.Data(), bytes.data(), bytes.size());
    const bool success = tag->DoConversion(buffer.Data(), conversion, toDevice);
    EXPECT_TRUE(buffer.AreGuardsIntact());
    return success ? HexDump(buffer.Bytes()) : "failed";
  };
  EXPECT_EQ(apply("swap2", "\1\2\3\4", true), "02 01 04 03");
  EXPECT_EQ(apply("swap4", "\1\2\3\4", false), "04 03 02 01");
  EXPECT_EQ(apply("swapnibble", "\x12\x34\x56\x78", true), "21 43 65 87");
  EXPECT_EQ(apply("inv", "\x0F\0\0\0"s, true), "F0 FF FF FF");
  EXPECT_EQ(apply("bcd", "\xD2\x04\0\0"s, true), "34 12 00 00");
  EXPECT_EQ(apply("bcd", "\x34\x12\0\0"s, false), "D2 04 00 00");
  EXPECT_EQ(apply("swap8", "\1\2\3\4", true), "failed");
  EXPECT_EQ(apply("neg", "\1\2\3\4", true), "failed");
  EXPECT_EQ(apply("", "\1\2\3\4", true), "failed");
  EXPECT_EQ(apply(nullptr, "\1\2\3\4", true), "failed");
}

TEST_F(ConversionTest, ReadsAndWritesGoThroughThem) {
  ASSERT_NE(P()->Start(), 0);
  Calls();
  EXPECT_TRUE(P().Write(P().Tag("0?tx_token?string-4(swap2)"), "ABCD"));
  EXPECT_EQ(Calls(), "queue.Lock\nSend 42 41 44 43\nqueue.Unlock\n");
  // 9600 in decimal digits is 38400, which is a rate as well.
  EXPECT_TRUE(P().Write(P().Tag("0?SP_Baud?unsignedInt(bcd)"), "\x80\x25\0\0"s));
  EXPECT_EQ(P().ReadNumber("SP_Baud"), 38400U);
  EXPECT_EQ(P().Read(P().Tag("0?SP_Baud?unsignedInt(bcd)")).bytes, "\x80\x25\0\0"s);
  EXPECT_EQ(P().Read(P().Tag("0?connect?boolean(inv)")).bytes, "\0"s);
}

TEST_F(ConversionTest, AReadThatCannotBeConverted) {
  ASSERT_NE(P()->Start(), 0);
  const ReadOutcome outcome = P().Read(P().Tag("0?SP_Baud?unsignedInt(neg)"));
  EXPECT_EQ(outcome.result, 0);
  EXPECT_TRUE(outcome.untouched);
  EXPECT_EQ(P().Error(), "-9 read conversion error");
  // The raw bytes can still be had.
  EXPECT_EQ(P().ReadBlock(P().Tag("0?SP_Baud?unsignedInt(neg)"), 4).bytes, "\x80\x25\0\0"s);
}

}  // namespace
