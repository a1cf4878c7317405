// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "host/document/DescriptionBlock.h"
#include "host/document/DescriptionDocument.h"
#include "host/framing/ConfigKeyTable.h"
#include "host/framing/DocumentDifferences.h"
#include "tests/support/PluginLibrary.h"

namespace {

class DocumentDifferencesTest : public ::testing::Test {
 protected:
  void SetUp() override {
    DescriptionBlock block;
    std::string error;
    ASSERT_TRUE(FindDescriptionInFile(PluginLibrary::DefaultPath(), &block, &error)) << error;
    ASSERT_TRUE(ParseDescription(block.xml, &document_, &error)) << error;
  }

  DescriptionDocument::Parameter& Find(const std::string& key) {
    for (DescriptionDocument::Parameter& parameter : document_.parameters) {
      if (parameter.key == key) {
        return parameter;
      }
    }
    ADD_FAILURE() << key;
    return document_.parameters.front();
  }

  DescriptionDocument document_;
};

TEST_F(DocumentDifferencesTest, TheHostsTableIsTheDriversDocument) {
  EXPECT_EQ(DocumentDifferences(document_), std::vector<std::string>());
  ASSERT_EQ(document_.parameters.size(), ConfigKeys().size());
  for (std::size_t i = 0; i < document_.parameters.size(); ++i) {
    EXPECT_EQ(document_.parameters[i].key, ConfigKeys()[i].key);
  }
}

TEST_F(DocumentDifferencesTest, EachKindOfDifferenceIsNamed) {
  Find("baudrate").defaultText = "19200";
  Find("bits").entries = {"5", "7", "8"};
  Find("token_queue_size").max = 50;
  Find("gap").isMandatory = true;
  Find("port").key = "door";
  EXPECT_EQ(DocumentDifferences(document_),
            std::vector<std::string>(
                {"door: the driver's description has this key, loka does not know it",
                 "baudrate: the driver's description gives the default 19200, loka knows 9600",
                 "bits: the driver's description gives the values 5, 7, 8, loka knows 7, 8",
                 "gap: the driver's description gives the mark mandatory, loka knows optional",
                 "token_queue_size: the driver's description gives the values 1 to 50, loka knows "
                 "1 to 10000",
                 "port: not in the driver's description"}));
}

}  // namespace
