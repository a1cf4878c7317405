// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <random>

#include "host/document/DescriptionBlock.h"
#include "tests/host/document/FakeLibrary.h"
#include "tests/host/support/TemporaryFolder.h"
#include "tests/host/support/TextParts.h"

namespace {

const std::string kZero(1, '\0');

std::string BlockErrorOf(const std::string& bytes) {
  DescriptionBlock block;
  std::string error;
  EXPECT_FALSE(FindDescription(bytes, &block, &error));
  EXPECT_EQ(block.xml, "");
  return error;
}

TEST(DescriptionBlock, IsFoundAmongOtherBytes) {
  const std::string bytes = std::string(5000, '\xFE') + BlockOf(Compress("<x/>")) + "tail";
  DescriptionBlock block;
  std::string error;
  ASSERT_TRUE(FindDescription(bytes, &block, &error)) << error;
  EXPECT_EQ(block.name, "LOKA");
  EXPECT_EQ(block.fullName, "Loka Serial");
  EXPECT_EQ(block.version, 111);
  EXPECT_EQ(block.platform, "ANY");
  EXPECT_EQ(block.compressedBytes, static_cast<int>(Compress("<x/>").size()));
  EXPECT_EQ(block.xml, "<x/>");
}

TEST(DescriptionBlock, FieldsStandInAnyOrderAndOthersArePassedOver) {
  const std::string bytes =
      BlockOf(Compress("<x/>"), "Nickname=no?Version=7?Name=A=B??Name=later?more");
  DescriptionBlock block;
  std::string error;
  ASSERT_TRUE(FindDescription(bytes, &block, &error)) << error;
  EXPECT_EQ(block.name, "A=B");
  EXPECT_EQ(block.fullName, "");
  EXPECT_EQ(block.version, 7);
  EXPECT_EQ(block.platform, "");
}

TEST(DescriptionBlock, MarkersWithoutABlockArePassedOver) {
  const std::string good = BlockOf(Compress("<good/>"));
  for (const std::string& bad : {std::string("<<VADO_XML_START>>"), "<<VADO_XML_START>>" + kZero,
                                 "<<VADO_XML_START>><<VADO_XML_END>>" + kZero, BlockOf("no stream"),
                                 std::string("<<VADO_XML_START>><<VADO_XML_START>>")}) {
    DescriptionBlock block;
    std::string error;
    ASSERT_TRUE(FindDescription(bad + good, &block, &error)) << error << bad;
    EXPECT_EQ(block.xml, "<good/>");
  }
}

TEST(DescriptionBlock, SaysWhatIsMissing) {
  EXPECT_TRUE(Holds(BlockErrorOf(""), "expected a driver library with the marker"));
  EXPECT_TRUE(Holds(BlockErrorOf("some text"), "expected a driver library with the marker"));
  EXPECT_TRUE(Holds(BlockErrorOf("<<VADO_XML_START>>Name=A"), "identification line does not end"));
  EXPECT_TRUE(
      Holds(BlockErrorOf("<<VADO_XML_START>>" + std::string(5000, 'x')), "identification line"));
  for (const char* line : {"", "Name=A", "Version=1", "Name=?Version=1", "Name=A?Version=x",
                           "Name=A?Version=-1", "Name=A?Version=99999999999"}) {
    EXPECT_TRUE(Holds(BlockErrorOf(BlockOf(Compress("<x/>"), line)), "lacks Name= or a Version="))
        << line;
  }
  const std::string start = std::string("<<VADO_XML_START>>") + kIdentification + kZero;
  EXPECT_TRUE(Holds(BlockErrorOf(start + "compressedXML=5"), "length line does not end"));
  for (const char* line :
       {"", "compressedXML", "compressedXML=", "compressedXML=0", "compressedXML=05",
        "compressedXML=-5", "compressedXML=+5", "compressedXML=5x", "compressedXML= 5", "5",
        "CompressedXML=5", "compressedXML=1048577", "compressedXML=99999999999999999999"}) {
    EXPECT_TRUE(Holds(BlockErrorOf(start + line + kZero + "12345<<VADO_XML_END>>" + kZero),
                      "expected a length line \"compressedXML=\""))
        << line;
  }
  EXPECT_TRUE(
      Holds(BlockErrorOf(start + "compressedXML=6" + kZero + "12345<<VADO_XML_END>>" + kZero),
            "expected the end marker"));
  EXPECT_TRUE(Holds(BlockErrorOf(start + "compressedXML=1048576" + kZero + "12345"),
                    "expected the end marker"));
  EXPECT_TRUE(
      Holds(BlockErrorOf(start + "compressedXML=5" + kZero + "12345<<VADO_XML_END>>" + kZero),
            "no whole zlib stream"));
}

TEST(DescriptionBlock, EveryTruncationIsRefused) {
  const std::string whole = BlockOf(Compress(SmallDocument()));
  for (std::size_t length = 0; length < whole.size(); ++length) {
    EXPECT_NE(BlockErrorOf(whole.substr(0, length)), "") << length;
  }
}

// A changed byte is either noticed or is one that the document does not hang on.
TEST(DescriptionBlock, ChangedBytesNeverGiveAnotherDocument) {
  const std::string whole = BlockOf(Compress(SmallDocument()));
  const std::size_t identificationEnd = whole.find('\0');
  for (std::size_t at = 0; at < whole.size(); ++at) {
    for (const unsigned int change : {1U, 0x80U, 0xFFU}) {
      std::string bytes = whole;
      bytes[at] = static_cast<char>(static_cast<unsigned char>(bytes[at]) ^ change);
      DescriptionBlock block;
      std::string error;
      if (FindDescription(bytes, &block, &error)) {
        EXPECT_EQ(block.xml, SmallDocument()) << at;
        EXPECT_TRUE(at < identificationEnd || block.compressedBytes > 0) << at;
      } else {
        EXPECT_NE(error, "") << at;
      }
    }
  }
}

TEST(DescriptionBlock, RandomBytesAreRefused) {
  std::mt19937 random(20260101);
  for (int round = 0; round < 200; ++round) {
    std::string bytes;
    for (int i = 0; i < 300; ++i) {
      bytes += static_cast<char>(static_cast<unsigned char>(random() & 0xFFU));
    }
    EXPECT_NE(BlockErrorOf(bytes), "");
    EXPECT_NE(BlockErrorOf("<<VADO_XML_START>>" + bytes), "");
    EXPECT_NE(BlockErrorOf(BlockOf(bytes)), "");
  }
}

// Each of these blocks would be inflated up to the limit; only some are.
TEST(DescriptionBlock, GivesUpAfterManyMarkers) {
  std::string markers;
  for (int i = 0; i < 64; ++i) {
    markers += "<<VADO_XML_START>>";
  }
  EXPECT_NE(BlockErrorOf(markers + BlockOf(Compress("<x/>"))), "");
  DescriptionBlock block;
  std::string error;
  EXPECT_TRUE(FindDescription(markers.substr(18) + BlockOf(Compress("<x/>")), &block, &error));
}

TEST(DescriptionBlock, IsReadFromTheLengthLineOn) {
  const std::string stream = Compress("<x/>");
  const std::string lines =
      "compressedXML=" + std::to_string(stream.size()) + kZero + stream + "more";
  DescriptionBlock block;
  std::string error;
  ASSERT_TRUE(ReadDescriptionAt(lines.c_str(), &block, &error)) << error;
  EXPECT_EQ(block.xml, "<x/>");
  EXPECT_EQ(block.compressedBytes, static_cast<int>(stream.size()));
  EXPECT_FALSE(ReadDescriptionAt("", &block, &error));
  EXPECT_FALSE(ReadDescriptionAt("compressedXML=", &block, &error));
  EXPECT_FALSE(ReadDescriptionAt("compressedXML=999999999999999999999", &block, &error));
  EXPECT_FALSE(ReadDescriptionAt("something else", &block, &error));
  EXPECT_TRUE(Holds(error, "expected a length line")) << error;
}

TEST(DescriptionBlock, FilesThatAreNoLibraries) {
  const TemporaryFolder folder;
  DescriptionBlock block;
  std::string error;
  EXPECT_FALSE(FindDescriptionInFile(folder.File("absent.so"), &block, &error));
  EXPECT_EQ(error, folder.File("absent.so") + ": No such file or directory");
  EXPECT_FALSE(FindDescriptionInFile(folder.Path().string(), &block, &error));
  EXPECT_TRUE(Holds(error, "this is no file")) << error;
  EXPECT_FALSE(FindDescriptionInFile("/dev/zero", &block, &error));
  EXPECT_TRUE(Holds(error, "this is no file")) << error;
  EXPECT_FALSE(FindDescriptionInFile(WriteAll(folder.File("empty.so"), ""), &block, &error));
  EXPECT_TRUE(Holds(error, "empty.so: no description here")) << error;
}

TEST(DescriptionBlock, HugeFileIsNotRead) {
  const TemporaryFolder folder;
  const std::string huge = WriteAll(folder.File("huge.so"), BlockOf(Compress("<x/>")));
  // A file with a hole: it takes no place on the disk.
  std::filesystem::resize_file(huge, 64UL * 1024 * 1024);
  DescriptionBlock block;
  std::string error;
  EXPECT_TRUE(FindDescriptionInFile(huge, &block, &error)) << error;
  std::filesystem::resize_file(huge, 1UL << 36U);
  EXPECT_FALSE(FindDescriptionInFile(huge, &block, &error));
  EXPECT_TRUE(Holds(error, "too large for a driver library: 68719476736 bytes")) << error;
}

TEST(DescriptionBlock, LibraryOfAnotherArchitecture) {
  const TemporaryFolder folder;
  const std::string file = WriteAll(folder.File("libARM.so"), ArmLibrary(PluginBlock()));
  DescriptionBlock block;
  std::string error;
  ASSERT_TRUE(FindDescriptionInFile(file, &block, &error)) << error;
  EXPECT_EQ(block.name, "LOKA");
  EXPECT_EQ(block.version, 111);
  EXPECT_EQ(Compress(block.xml), StreamOf(PluginBlock()));
}

}  // namespace
