// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <nlohmann/json.hpp>

#include "host/document/DescriptionReport.h"

namespace {

using Json = nlohmann::json;

DescriptionBlock Block() {
  DescriptionBlock block;
  block.name = "DEMO";
  block.fullName = "Demo Serial";
  block.version = 5;
  block.compressedBytes = 3;
  block.xml = "12345678";
  return block;
}

DescriptionDocument::Parameter Parameter(const std::string& key, const std::string& type) {
  DescriptionDocument::Parameter parameter;
  parameter.key = key;
  parameter.display = "Name of " + key;
  parameter.type = type;
  return parameter;
}

DescriptionDocument Document() {
  DescriptionDocument document;
  document.properties = {{"name", "007"}, {"usesUart", "true"}, {"code", "471"}, {"odd", "007"}};
  document.parameters = {Parameter("list", "prop_list"), Parameter("number", "prop_integer"),
                         Parameter("flag", "prop_bool"), Parameter("text", "prop_string")};
  document.parameters[0].entries = {"a", "b"};
  document.parameters[0].listType = "prop_string";
  document.parameters[0].defaultText = "a";
  document.parameters[0].isMandatory = true;
  document.parameters[1].min = 1;
  document.parameters[1].max = 10000;
  DescriptionDocument::MemoryType memoryType;
  memoryType.name = "weight";
  memoryType.display = "W\xC3\xA4gung";
  memoryType.naturalType = "byte";
  memoryType.vadoTypes = 0x200;
  memoryType.max = 7;
  memoryType.isReadOnly = true;
  memoryType.flags = {{"isReadOnly", true}, {"isWriteOnly", false}};
  document.memoryTypes = {memoryType};
  return document;
}

TEST(DescriptionReport, TextHasATableOfKeysAndOneOfMemoryTypes) {
  EXPECT_EQ(DescribeAsText(Block(), Document()),
            "DEMO  Demo Serial  version 5  code 471\n"
            "document: 8 bytes, 3 compressed\n"
            "\n"
            "Configuration\n"
            "  key     default  required  name            values\n"
            "  list    a        yes       Name of list    a b\n"
            "  number  -        no        Name of number  whole number, 1 to 10000\n"
            "  flag    -        no        Name of flag    true false\n"
            "  text    -        no        Name of text    text\n"
            "\n"
            "Memory types\n"
            "  memory type  access  natural type  mask   items   name\n"
            "  weight       read    byte          0x200  0 to 7  W\xC3\xA4gung\n");
}

TEST(DescriptionReport, TextIsSafeForATerminal) {
  DescriptionBlock block = Block();
  block.fullName = "\x1B[2J\xFF";
  block.platform = "two\nlines";
  DescriptionDocument document = Document();
  document.parameters[0].entries = {"\x1B]0;title\x07"};
  document.memoryTypes[0].display = "a\r\nb\tc";
  const std::string text = DescribeAsText(block, document);
  for (const char character : text) {
    EXPECT_TRUE(character == '\n' || static_cast<unsigned char>(character) >= 0x20) << text;
  }
  EXPECT_NE(text.find("\\x1B[2J\\xFF"), std::string::npos) << text;
  EXPECT_NE(text.find("platform two lines"), std::string::npos) << text;
}

TEST(DescriptionReport, JsonHasTypedValues) {
  const Json json = Json::parse(DescribeAsJson(Block(), Document()));
  EXPECT_EQ(
      json["module"],
      Json({{"name", "DEMO"}, {"fullName", "Demo Serial"}, {"version", 5}, {"platform", nullptr}}));
  EXPECT_EQ(json["properties"],
            Json({{"name", "007"}, {"usesUart", true}, {"code", 471}, {"odd", "007"}}));
  const Json& list = json["parameters"][0];
  EXPECT_EQ(list["entries"], Json({"a", "b"}));
  EXPECT_EQ(list["listType"], "prop_string");
  EXPECT_EQ(list["isMandatory"], true);
  EXPECT_EQ(list["min"], nullptr);
  const Json& number = json["parameters"][1];
  EXPECT_EQ(number["min"], 1);
  EXPECT_EQ(number["max"], 10000);
  EXPECT_EQ(number["entries"], nullptr);
  EXPECT_EQ(number["listType"], nullptr);
  EXPECT_EQ(json["memoryTypes"][0]["vadoTypes"], 512);
  EXPECT_EQ(json["memoryTypes"][0]["isReadOnly"], true);
  EXPECT_EQ(json["tagFields"], Json::array());
  EXPECT_EQ(json["models"], Json::array());
}

TEST(DescriptionReport, JsonReplacesBytesThatAreNoUtf8) {
  DescriptionBlock block = Block();
  block.platform = "\xFF";
  const Json json = Json::parse(DescribeAsJson(block, Document()));
  EXPECT_EQ(json["module"]["platform"], "\xEF\xBF\xBD");
}

}  // namespace
