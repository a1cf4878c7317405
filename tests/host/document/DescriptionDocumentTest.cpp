// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "host/document/DescriptionBlock.h"
#include "host/document/DescriptionDocument.h"
#include "tests/host/document/FakeLibrary.h"

namespace {

constexpr const char* kParameter =
    R"(<parameter display="D" default="1" isNodeProperty="false" group="g" type="prop_integer" )"
    R"(min="1" max="9" isDistinct="false" isMandatory="true">key</parameter>)";
constexpr const char* kMemoryType =
    R"(<memtype canBitWrite="false" isSwap2="false" display="D" isSwap4="false" )"
    R"(mustBitRead="true" blockReadCount="3" blockWriteCount="4" vadoTypes="0x240" )"
    R"(naturalType="byte" isSwap8="false" hasInternalConversion="false" useInDatagram="false" )"
    R"(canBitArrayWrite="false" min="-1" max="2" isReadOnly="true" isWriteOnly="false">m)"
    R"(</memtype>)";

struct Parts {
  std::string parameters = kParameter;
  std::string memoryTypes = kMemoryType;
};

std::string Xml(const Parts& parts) {
  return "<protocol_cfg><name>N</name><usesUart>true</usesUart><parameters>" + parts.parameters +
         "</parameters><memtypes>" + parts.memoryTypes +
         "</memtypes><tag_uri><tag_field display=\"T\" default=\"d\" type=\"prop_memRef\" "
         "mandatory=\"true\">field</tag_field></tag_uri><models><model display=\"M\" "
         "datagramCount=\"5\" datagramLength=\"6\">1<memtype_ref min=\"7\" max=\"8\">m"
         "</memtype_ref></model></models><conversions/></protocol_cfg>";
}

std::string DocumentErrorOf(const std::string& xml) {
  DescriptionDocument document;
  document.models.resize(1);
  std::string error = "stale";
  EXPECT_FALSE(ParseDescription(xml, &document, &error)) << xml;
  EXPECT_EQ(document.models.size(), 1U) << "touched";
  return error;
}

std::string Replaced(std::string text, const std::string& from, const std::string& to) {
  const std::size_t at = text.find(from);
  EXPECT_NE(at, std::string::npos) << from;
  return text.replace(at, from.size(), to);
}

TEST(DescriptionDocument, TakesEverything) {
  DescriptionDocument document;
  std::string error;
  ASSERT_TRUE(ParseDescription(Xml({}), &document, &error)) << error;
  ASSERT_EQ(document.properties.size(), 2U);
  EXPECT_EQ(document.Property("usesUart"), "true");
  EXPECT_EQ(document.Property("absent"), "");
  ASSERT_EQ(document.parameters.size(), 1U);
  const DescriptionDocument::Parameter* const parameter = document.FindParameter("key");
  ASSERT_NE(parameter, nullptr);
  EXPECT_EQ(parameter->display, "D");
  EXPECT_EQ(parameter->type, "prop_integer");
  EXPECT_EQ(parameter->group, "g");
  EXPECT_EQ(parameter->defaultText, "1");
  EXPECT_TRUE(parameter->isMandatory);
  EXPECT_FALSE(parameter->isNodeProperty);
  EXPECT_EQ(parameter->min, 1);
  EXPECT_EQ(parameter->max, 9);
  EXPECT_EQ(document.FindParameter("Key"), nullptr);
  ASSERT_EQ(document.memoryTypes.size(), 1U);
  const DescriptionDocument::MemoryType& memoryType = document.memoryTypes.front();
  EXPECT_EQ(memoryType.name, "m");
  EXPECT_EQ(memoryType.vadoTypes, 0x240U);
  EXPECT_EQ(memoryType.min, -1);
  EXPECT_EQ(memoryType.max, 2);
  EXPECT_EQ(memoryType.blockReadCount, 3);
  EXPECT_EQ(memoryType.blockWriteCount, 4);
  EXPECT_TRUE(memoryType.isReadOnly);
  EXPECT_FALSE(memoryType.isWriteOnly);
  EXPECT_EQ(memoryType.flags.size(), 10U);
  ASSERT_EQ(document.tagFields.size(), 1U);
  EXPECT_EQ(document.tagFields.front().name, "field");
  EXPECT_EQ(document.tagFields.front().defaultText, "d");
  EXPECT_TRUE(document.tagFields.front().isMandatory);
  ASSERT_EQ(document.models.size(), 1U);
  EXPECT_EQ(document.models.front().name, "1");
  EXPECT_EQ(document.models.front().datagramCount, 5);
  EXPECT_EQ(document.models.front().datagramLength, 6);
  ASSERT_EQ(document.models.front().memoryTypes.size(), 1U);
  EXPECT_EQ(document.models.front().memoryTypes.front().max, 8);
}

TEST(DescriptionDocument, ReadsTheDriversOwn) {
  DescriptionBlock block;
  DescriptionDocument document;
  std::string error;
  ASSERT_TRUE(FindDescriptionInFile(PluginLibrary::DefaultPath(), &block, &error)) << error;
  ASSERT_TRUE(ParseDescription(block.xml, &document, &error)) << error;
  EXPECT_EQ(document.properties.size(), 27U);
  EXPECT_EQ(document.Property("code"), "471");
  EXPECT_EQ(document.parameters.size(), 16U);
  EXPECT_EQ(document.memoryTypes.size(), 19U);
  EXPECT_EQ(document.tagFields.size(), 3U);
  ASSERT_EQ(document.models.size(), 1U);
  EXPECT_EQ(document.models.front().memoryTypes.size(), 19U);
  const DescriptionDocument::Parameter* const port = document.FindParameter("port");
  ASSERT_NE(port, nullptr);
  EXPECT_EQ(port->listType, "prop_string");
  ASSERT_EQ(port->entries.size(), 16U);
  EXPECT_EQ(port->entries.back(), "com16");
  EXPECT_FALSE(port->min.has_value());
  const DescriptionDocument::Parameter* const size = document.FindParameter("token_queue_size");
  ASSERT_NE(size, nullptr);
  EXPECT_EQ(size->defaultText, "100");
  EXPECT_EQ(size->max, 10000);
}

TEST(DescriptionDocument, OtherEncodingsAndFormsAreRefused) {
  EXPECT_EQ(DocumentErrorOf("<a>\xFF</a>"), "the document is no XML text in UTF-8");
  EXPECT_EQ(DocumentErrorOf("<a>\x01</a>"), "the document is no XML text in UTF-8");
  EXPECT_EQ(DocumentErrorOf(std::string("<a/>\0", 5)), "the document is no XML text in UTF-8");
  for (const char* xml : {"", "text", "<a>", "<a></b>", "<a b=c/>", "<a/><b/>"}) {
    EXPECT_EQ(DocumentErrorOf(xml).rfind("the document is no well-formed XML: ", 0), 0U) << xml;
  }
  EXPECT_EQ(DocumentErrorOf("<other/>"), "expected the root element protocol_cfg, found 'other'");
}

TEST(DescriptionDocument, MissingSectionsAreNamed) {
  for (const char* section : {"parameters", "memtypes", "tag_uri", "models"}) {
    const std::string xml = Replaced(SmallDocument(), std::string("<") + section + "/>", "");
    EXPECT_EQ(DocumentErrorOf(xml), std::string("the element ") + section + " is missing");
  }
}

TEST(DescriptionDocument, WrongAttributesAreNamed) {
  const auto withParameter = [](const std::string& from, const std::string& to) {
    return DocumentErrorOf(Xml({Replaced(kParameter, from, to), ""}));
  };
  const auto withMemoryType = [](const std::string& from, const std::string& to) {
    return DocumentErrorOf(Xml({"", Replaced(kMemoryType, from, to)}));
  };
  EXPECT_EQ(withParameter("display=\"D\"", ""),
            "the element parameter 'key' lacks the attribute display");
  EXPECT_EQ(withParameter("isMandatory=\"true\"", "isMandatory=\"yes\""),
            "the element parameter 'key' has isMandatory=\"yes\", expected true or false");
  EXPECT_EQ(withParameter("min=\"1\"", "min=\"1x\""),
            "the element parameter 'key' has min=\"1x\", expected a whole number");
  EXPECT_EQ(withParameter("max=\"9\"", "max=\"99999999999999999999\""),
            "the element parameter 'key' has max=\"99999999999999999999\", expected a whole "
            "number");
  EXPECT_EQ(withParameter(">key<", "><"), "the element parameter '' has no text");
  for (const char* mask : {"240", "0x", "0xG", "0x-1", "0x100000000"}) {
    EXPECT_EQ(withMemoryType("vadoTypes=\"0x240\"", std::string("vadoTypes=\"") + mask + "\""),
              std::string("the element memtype 'm' has vadoTypes=\"") + mask +
                  "\", expected 0x and hexadecimal digits");
  }
  EXPECT_EQ(withMemoryType("min=\"-1\"", ""), "the element memtype 'm' lacks the attribute min");
}

TEST(DescriptionDocument, ErrorsAreShortAndSafeForATerminal) {
  const std::string key = "&#27;[31m" + std::string(100000, 'k');
  const std::string error = DocumentErrorOf(Xml(
      {Replaced(Replaced(kParameter, ">key<", ">" + key + "<"), "min=\"1\"", "min=\"a\""), ""}));
  EXPECT_EQ(error.rfind("the element parameter '\\x1B[31mkkk", 0), 0U) << error;
  EXPECT_LT(error.size(), 200U);
}

TEST(DescriptionDocument, DepthAndNumberOfElementsAreLimited) {
  std::string open;
  std::string close;
  for (int i = 0; i < 100000; ++i) {
    open += "<a>";
    close += "</a>";
  }
  EXPECT_EQ(DocumentErrorOf("<protocol_cfg>" + open + close + "</protocol_cfg>"),
            "the document nests more than 32 elements");
  std::string many;
  for (int i = 0; i < 257; ++i) {
    many += "<p>1</p>";
  }
  EXPECT_EQ(DocumentErrorOf("<protocol_cfg>" + many + "</protocol_cfg>"),
            "the document has more than 256 properties");
}

}  // namespace
