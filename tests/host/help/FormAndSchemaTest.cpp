// SPDX-License-Identifier: Apache-2.0
// The description as a form and as a JSON Schema, both of the driver that is built.
#include <gtest/gtest.h>

#include <fstream>
#include <nlohmann/json.hpp>
#include <pugixml.hpp>
#include <set>

#include "host/document/DescriptionForm.h"
#include "host/document/DescriptionSchema.h"
#include "host/framing/ConfigKeyTable.h"
#include "tests/host/support/ProgramRun.h"

namespace {

using Json = nlohmann::json;

std::string Described(const std::string& form) {
  ProgramRun run({"describe", form});
  std::string text = run.Output();
  EXPECT_EQ(run.Status(), 0) << run.Errors();
  return text;
}

Json GoodConfiguration() {
  return {{"CfgVer", 1},      {"model", "1"}, {"port", "com1"}, {"baudrate", 9600},
          {"parity", "even"}, {"bits", 8},    {"stopbits", 1},  {"mode", "RS-232"}};
}

TEST(DescriptionSchema, HasEveryKey) {
  const Json schema = Json::parse(Described("--schema"));
  for (const ConfigKey& key : ConfigKeys()) {
    const std::string name(key.key);
    ASSERT_TRUE(schema["properties"].contains(name)) << name;
    const Json& property = schema["properties"][name];
    EXPECT_TRUE(property.contains("default")) << name;
    const auto& required = schema["required"];
    EXPECT_EQ(std::count(required.begin(), required.end(), Json(name)), key.isMandatory ? 1 : 0);
  }
  EXPECT_EQ(schema["properties"].size(), ConfigKeys().size());
}

// An independent reader of schemas tells good configurations from bad ones.
TEST(DescriptionSchema, TellsGoodFromBad) {
  Json good = Json::array({GoodConfiguration()});
  for (const auto& [key, value] : std::map<std::string, Json>{{"parity", "mark"},
                                                              {"rx_prefix", "02aF"},
                                                              {"rx_suffix", "none"},
                                                              {"tx_suffix", ""},
                                                              {"gap", 50},
                                                              {"hex_tokens", true},
                                                              {"token_queue_size", 10000},
                                                              {"autoConnect", false},
                                                              {"baudrate", 115200}}) {
    Json more = GoodConfiguration();
    more[key] = value;
    good.push_back(more);
  }
  Json bad = Json::array();
  for (const auto& [key, value] : std::multimap<std::string, Json>{{"parity", "space"},
                                                                   {"rx_prefix", "0"},
                                                                   {"rx_suffix", "STX"},
                                                                   {"gap", "50"},
                                                                   {"hex_tokens", "true"},
                                                                   {"token_queue_size", 0},
                                                                   {"token_queue_size", 10001},
                                                                   {"baudrate", 9601},
                                                                   {"baudrate", "9600"},
                                                                   {"bits", 5},
                                                                   {"port", "com17"},
                                                                   {"mode", "RS-423"},
                                                                   {"speed", 1}}) {
    Json more = GoodConfiguration();
    more[key] = value;
    bad.push_back(more);
  }
  Json lacking = GoodConfiguration();
  lacking.erase("baudrate");
  bad.push_back(lacking);
  const TemporaryFolder folder;
  std::ofstream(folder.File("all.json"))
      << Json{{"schema", Json::parse(Described("--schema"))}, {"good", good}, {"bad", bad}};
  std::ofstream(folder.File("check.py")) << R"(import json, sys
from jsonschema import Draft202012Validator
a = json.load(open(sys.argv[1]))
Draft202012Validator.check_schema(a["schema"])
v = Draft202012Validator(a["schema"])
print("good", [g for g in a["good"] if not v.is_valid(g)])
print("bad", [b for b in a["bad"] if v.is_valid(b)])
)";
  ChildProcess python("/usr/bin/env",
                      {"env", "python3", folder.File("check.py"), folder.File("all.json")});
  std::string line;
  const Deadline deadline = Deadline::After(ProgramRun::kLimitMs);
  ASSERT_TRUE(python.ReadLine(deadline, &line)) << "python3-jsonschema is needed";
  EXPECT_EQ(line, "good []");
  ASSERT_TRUE(python.ReadLine(deadline, &line));
  EXPECT_EQ(line, "bad []");
  EXPECT_EQ(python.Wait(deadline), 0);
}

class DescriptionFormTest : public ::testing::Test {
 protected:
  void SetUp() override {
    text_ = Described("--html");
    const pugi::xml_parse_result result = page_.load_string(text_.c_str());
    ASSERT_TRUE(result) << result.description();
  }

  std::string text_;
  pugi::xml_document page_;
};

TEST_F(DescriptionFormTest, HasOneInputAKeyWithALabelAndHelp) {
  std::set<std::string> ids;
  for (const auto& node : page_.select_nodes("//*[@id]")) {
    EXPECT_TRUE(ids.insert(node.node().attribute("id").value()).second)
        << node.node().attribute("id").value();
  }
  for (const ConfigKey& key : ConfigKeys()) {
    const std::string name(key.key);
    const auto inputs = page_.select_nodes(("//form//*[@name='" + name + "']").c_str());
    ASSERT_EQ(inputs.size(), 1U) << name;
    const pugi::xml_node input = inputs.begin()->node();
    EXPECT_EQ(std::string(input.attribute("data-default").value()), key.defaultText) << name;
    EXPECT_EQ(input.attribute("data-mandatory").as_bool(), key.isMandatory) << name;
    const std::string id = input.attribute("id").value();
    EXPECT_EQ(page_.select_nodes(("//label[@for='" + id + "']").c_str()).size(), 1U) << name;
    const std::string help = input.attribute("aria-describedby").value();
    const std::string meaning =
        page_.select_node(("//p[@id='" + help + "']").c_str()).node().text().get();
    EXPECT_EQ(meaning.rfind(key.meaning, 0), 0U) << name << ": " << meaning;
  }
  EXPECT_EQ(page_.select_nodes("//form//*[@data-default]").size(), ConfigKeys().size());
}

TEST_F(DescriptionFormTest, BeginsWithAConfigurationThatTheDriverTakes) {
  const std::string text = page_.select_node("//textarea[@id='configuration']").node().text().get();
  ProgramRun check({"config", "check", text});
  EXPECT_EQ(check.Status(), 0) << text << check.Errors();
}

TEST_F(DescriptionFormTest, HasTheTablesAndNamesNoOutsideAddress) {
  EXPECT_EQ(page_.select_nodes("//table[caption]").size(), 2U);
  EXPECT_EQ(page_.select_nodes("(//table)[1]/tbody/tr").size(), 19U);
  EXPECT_EQ(page_.select_nodes("(//table)[2]/tbody/tr").size(), 12U);
  for (const char* const outside : {"http:", "https:", "//cdn", "@import", "url("}) {
    EXPECT_EQ(text_.find(outside), std::string::npos) << outside;
  }
  EXPECT_TRUE(page_.select_nodes("//*[@src or @href]").empty());
}

// Texts of a description are not taken for markup.
TEST(DescriptionForm, EscapesWhatADescriptionSays) {
  DescriptionBlock block;
  block.name = "<script>\"&";
  DescriptionDocument document;
  DescriptionDocument::Parameter parameter;
  parameter.key = "a\"><b>";
  parameter.display = "</label>";
  parameter.type = "prop_string";
  parameter.defaultText = "'\"&<";
  parameter.isMandatory = true;
  document.parameters.push_back(parameter);
  pugi::xml_document page;
  ASSERT_TRUE(page.load_string(DescribeAsForm(block, document, {}).c_str()));
  const pugi::xml_node input = page.select_node("//input").node();
  EXPECT_EQ(std::string(input.attribute("name").value()), parameter.key);
  EXPECT_EQ(std::string(input.attribute("value").value()), parameter.defaultText);
  EXPECT_EQ(page.select_nodes("//script").size(), 1U);
}

}  // namespace
