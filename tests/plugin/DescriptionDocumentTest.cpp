// SPDX-License-Identifier: Apache-2.0
// The description document as a host and as a scanning tool find it.
#include <zlib.h>

#include <cstring>
#include <fstream>
#include <iterator>

#include "tests/plugin/PluginFixture.h"
#include "tests/support/PluginLibrary.h"

namespace {

constexpr const char* kIdentification =
    "<<VADO_XML_START>>Name=LOKA?FullName=Loka Serial?Version=111?Platform=QM77_LIN";
constexpr const char* kLengthKey = "compressedXML=";
constexpr const char* kEnd = "<<VADO_XML_END>>";
constexpr std::size_t kDocumentBytes = 14211;
constexpr std::size_t kStreamBytes = 1782;

std::string Slurp(const std::string& path) {
  std::ifstream file(path, std::ios::binary);
  return {std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>()};
}

std::string Inflate(const std::string& stream) {
  std::string text(1 << 20, '\0');
  auto length = static_cast<uLongf>(text.size());
  auto used = static_cast<uLong>(stream.size());
  EXPECT_EQ(uncompress2(reinterpret_cast<Bytef*>(text.data()), &length,
                        reinterpret_cast<const Bytef*>(stream.data()), &used),
            Z_OK);
  EXPECT_EQ(used, stream.size()) << "the stream is longer than the document needs";
  text.resize(length);
  return text;
}

class DescriptionDocumentTest : public ProtocolFixture {
 protected:
  // The stream behind a length line.
  static std::string StreamBehind(const char* lengthLine) {
    EXPECT_EQ(std::strncmp(lengthLine, kLengthKey, std::strlen(kLengthKey)), 0);
    const char* digits = lengthLine + std::strlen(kLengthKey);
    EXPECT_NE(*digits, '0');
    const std::size_t length = std::stoul(digits);
    EXPECT_EQ(std::to_string(length), digits);
    return {digits + std::strlen(digits) + 1, length};
  }
};

TEST_F(DescriptionDocumentTest, IsFoundThroughTheProtocol) {
  const char* lengthLine = P()->GetXml();
  ASSERT_NE(lengthLine, nullptr);
  const std::string stream = StreamBehind(lengthLine);
  EXPECT_EQ(stream.size(), kStreamBytes);
  const char* behind = lengthLine + std::strlen(lengthLine) + 1 + stream.size();
  EXPECT_STREQ(behind, kEnd);
  EXPECT_STREQ(lengthLine - std::strlen(kIdentification) - 1, kIdentification);
}

TEST_F(DescriptionDocumentTest, InflatesToTheReadableFile) {
  const std::string text = Inflate(StreamBehind(P()->GetXml()));
  EXPECT_EQ(text.size(), kDocumentBytes);
  EXPECT_EQ(text, Slurp(std::string(LOKA_SOURCE_DIR) + "/driver/Xml_LOKA.xml"));
  EXPECT_EQ(text.substr(0, 39), "<?xml version=\"1.0\" encoding=\"utf-8\"?>\n");
  EXPECT_EQ(text.find('\r'), std::string::npos);
  EXPECT_EQ(text.substr(text.size() - 16), "</protocol_cfg>\n");
}

TEST_F(DescriptionDocumentTest, IsCompressedByDefaultCompression) {
  const std::string stream = StreamBehind(P()->GetXml());
  const std::string text = Inflate(stream);
  uLongf length = compressBound(text.size());
  std::string again(length, '\0');
  ASSERT_EQ(compress(reinterpret_cast<Bytef*>(again.data()), &length,
                     reinterpret_cast<const Bytef*>(text.data()), text.size()),
            Z_OK);
  again.resize(length);
  EXPECT_EQ(again, stream);
}

TEST_F(DescriptionDocumentTest, IsFoundByScanningTheLibrary) {
  const std::string library = Slurp(PluginLibrary::DefaultPath());
  const std::size_t start = library.find(kIdentification);
  ASSERT_NE(start, std::string::npos);
  const char* lengthLine = library.c_str() + start + std::strlen(kIdentification) + 1;
  EXPECT_EQ(StreamBehind(lengthLine), StreamBehind(P()->GetXml()));
}

TEST_F(DescriptionDocumentTest, NamesTheDriverAsItsOperationsDo) {
  const std::string identification = kIdentification;
  EXPECT_NE(identification.find("Name=" + std::string(P()->GetName()) + "?"), std::string::npos);
  EXPECT_NE(identification.find("FullName=" + std::string(P()->GetProtocolName()) + "?"),
            std::string::npos);
  EXPECT_NE(identification.find("Version=" + std::to_string(P()->GetProtocolVersion()) + "?"),
            std::string::npos);
}

}  // namespace
