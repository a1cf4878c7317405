// SPDX-License-Identifier: Apache-2.0
// The manual's chapters on tags and on settings at run time against the driver.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstring>
#include <map>
#include <regex>
#include <set>

#include "driver/MemoryTypeCatalogue.h"
#include "driver/SerialSettings.h"
#include "protlib/ProtUtilsN.h"
#include "tests/docs/DriverInUse.h"
#include "tests/docs/MarkdownText.h"
#include "tests/docs/SourceText.h"

namespace {

using Row = MarkdownText::Row;

const std::string kKeys =
    "model=1 port=com1 baudrate=9600 parity=even bits=8 stopbits=1 mode=RS-232";
const std::string kConfig = "CfgVer=1 " + kKeys;

// A type name as the manual writes it: "string-N" is the catalogue's "string-".
std::string CatalogueName(std::string name) {
  if (name.size() > 2 && name.compare(name.size() - 2, 2, "-N") == 0) name.pop_back();
  return name;
}

std::string AccessOf(const MemoryTypeRow& row) {
  return row.readOnly ? "read" : row.writeOnly ? "write" : "read and write";
}

class ManualTagsTest : public ::testing::Test {
 protected:
  const MarkdownText manual_{"docs/manual.md"};
};

TEST_F(ManualTagsTest, TheMemoryTypesAreThoseOfTheCatalogue) {
  const std::vector<Row> rows = manual_.Rows("Memory type");
  ASSERT_EQ(rows.size(), kMemoryTypes.size());
  for (std::size_t i = 0; i < rows.size(); ++i) {
    const MemoryTypeRow& memoryType = kMemoryTypes[i];
    EXPECT_EQ(TheSpan(rows[i][0]), memoryType.name);
    EXPECT_EQ(rows[i][1], memoryType.displayName);
    EXPECT_EQ(rows[i][3], AccessOf(memoryType)) << memoryType.name;
    const std::string name = CatalogueName(TheSpan(rows[i][2]));
    unsigned int flag = 0;
    for (const auto& type : ProtUtilsN::DataTypes) {
      if (name == type.name) flag = ProtUtilsN::GetTypeFlag(type.type);
    }
    EXPECT_EQ(flag, static_cast<unsigned int>(memoryType.vadoTypes)) << memoryType.name;
    EXPECT_EQ(rows[i][5] == "refused", memoryType.readOnly) << memoryType.name;
  }
}

TEST_F(ManualTagsTest, TheTypeNamesAreThoseOfTheCatalogue) {
  std::multiset<std::string> inManual;
  for (const Row& row : manual_.Rows("Data type")) inManual.insert(CatalogueName(TheSpan(row[0])));
  EXPECT_EQ(inManual.size(), 4U);
  for (const std::string& line : manual_.Lines()) {
    if (line.compare(0, 16, "Other type names") != 0) continue;
    for (const std::string& span : CodeSpans(line)) inManual.insert(span);
  }
  inManual.erase("not allowed vado type");
  std::multiset<std::string> inCode;
  for (const auto& type : ProtUtilsN::DataTypes) inCode.insert(type.name);
  EXPECT_EQ(inManual, inCode);
}

TEST_F(ManualTagsTest, TheUsableTypesHaveTheLengthsSaid) {
  for (const Row& row : manual_.Rows("Data type")) {
    std::string spec = TheSpan(row[0]);
    std::string bytes = row[1];
    if (bytes == "N") {
      spec = CatalogueName(spec) + "17";
      bytes = "17";
    }
    ICU_Type type{};
    ICU_Type itemType{};
    int length = 0;
    std::vector<std::string> conversions;
    ASSERT_TRUE(ProtUtilsN::GetVADOType(spec, type, itemType, length, conversions)) << spec;
    EXPECT_EQ(std::to_string(length), bytes) << spec;
  }
}

TEST_F(ManualTagsTest, EveryUriIsAcceptedUnlessItIsCalledWrong) {
  std::set<std::string> wrong;
  for (const Row& row : manual_.Rows("Wrong tag URI")) wrong.insert(TheSpan(row[0]));
  const std::regex uri(R"([^ <?]*\?[^ ?]*(\?[^ ]*)?)");
  DriverInUse use;
  ASSERT_EQ(use.Config(kConfig), "");
  int count = 0;
  for (const std::string& span : manual_.Spans()) {
    if (span == "?" || !std::regex_match(span, uri) || wrong.count(span) != 0) continue;
    EXPECT_EQ(use.TagError(span), "") << span;
    ++count;
  }
  EXPECT_GE(count, 15);
}

TEST_F(ManualTagsTest, EveryWrongUriIsRefusedWithItsReason) {
  DriverInUse use;
  ASSERT_EQ(use.Config(kConfig), "");
  for (const Row& row : manual_.Rows("Wrong tag URI")) {
    const std::string uri = TheSpan(row[0]);
    EXPECT_EQ(use.TagError(uri), "Tag URI error: " + uri + " - " + TheSpan(row[1]));
  }
}

TEST_F(ManualTagsTest, TheConversionsAreThoseOfTheCode) {
  std::multiset<std::string> inManual;
  for (const Row& row : manual_.Rows("Conversion")) inManual.insert(TheSpan(row[0]));
  const std::string code = ReadProjectFile("protlib/TagBase_Convert.cpp");
  const std::regex keyword(R"re(\bis\("(\w+)"\))re");
  std::multiset<std::string> inCode;
  for (std::sregex_iterator at(code.begin(), code.end(), keyword), end; at != end; ++at) {
    inCode.insert((*at)[1]);
  }
  EXPECT_EQ(inManual, inCode);
}

// Which conversions a driver's tag can be read with, tried on an empty queue or a false value.
TEST_F(ManualTagsTest, TheConversionsWorkWithTheTypesSaid) {
  DriverInUse use;
  ASSERT_TRUE(use.Start(kConfig));
  const auto works = [&use](const std::string& uri) {
    std::string value;
    return use.Read(uri, value);
  };
  for (const char* uri : {"0?connect?boolean", "0?SP_Par?unsignedByte", "0?SP_Gap?unsignedInt",
                          "0?rx_token?string-8", "0?rx_token?string-7"}) {
    const std::string type = std::strrchr(uri, '?') + 1;
    const bool isString = type.compare(0, 7, "string-") == 0;
    const int bytes = isString ? type.back() - '0' : type == "unsignedInt" ? 4 : 1;
    const auto with = [&](const char* conversion) {
      return works(uri + ("(" + std::string(conversion) + ")"));
    };
    EXPECT_TRUE(with("swapnibble")) << uri;
    EXPECT_EQ(with("swap2"), bytes % 2 == 0) << uri;
    EXPECT_EQ(with("swap4"), bytes % 4 == 0) << uri;
    EXPECT_EQ(with("swap8"), bytes % 8 == 0) << uri;
    EXPECT_TRUE(with("bcd")) << uri;
    EXPECT_EQ(with("neg"), isString) << uri;
    EXPECT_EQ(with("inv"), !isString) << uri;
    EXPECT_FALSE(with("swop2")) << uri;
  }
  EXPECT_STREQ(use.Driver().GetLastErrorString(), "read conversion error");
}

class ManualSettingsTest : public ManualTagsTest {
 protected:
  std::vector<Row> Settings() const { return manual_.Rows("Setting"); }

  // A value as a tag of this memory type carries it.
  static std::string ValueOf(const MemoryTypeRow& memoryType, int value) {
    std::string bytes(sizeof value, '\0');
    std::memcpy(bytes.data(), &value, sizeof value);
    return memoryType.naturalType == ICU_UNSIGNED_INT ? bytes : bytes.substr(0, 1);
  }

  static std::string UriOf(const MemoryTypeRow& memoryType) {
    const std::string type = memoryType.naturalType == ICU_BYTE
                                 ? "string-8"
                                 : ProtUtilsN::GetVADOName(memoryType.naturalType, 1);
    return "0?" + std::string(memoryType.name) + "?" + type;
  }
};

TEST_F(ManualSettingsTest, TheSettingsAreAllThatCanBeStaged) {
  std::multiset<std::string> inManual;
  std::multiset<std::string> stored;
  for (const Row& row : Settings()) {
    inManual.insert(TheSpan(row[2]));
    stored.insert(TheSpan(row[3]));
  }
  std::multiset<std::string> inCode = {"SP_Done"};
  inManual.insert("SP_Done");
  for (const MemoryTypeRow& row : kMemoryTypes) {
    if (row.isSerialParam && row.id != MemoryTypeId::kDone) inCode.insert(row.name);
  }
  EXPECT_EQ(inManual, inCode);
  std::multiset<std::string> names;
  for (const auto& [constant, name] : ConstantsOf("driver/ParameterNames.h")) names.insert(name);
  EXPECT_EQ(stored, names);
}

// Configured by the key said, the value shows in a read of the memory type said; applied by it, the
// next value is stored under the name said.
TEST_F(ManualSettingsTest, EachSettingHasTheKeyAndTheStoredNameSaid) {
  struct Values {
    const char* configured;
    int code;  // of the configured value
    int applied;
  };
  const std::map<std::string, Values> kValues = {
      {"baudrate", {"300", 300, 600}}, {"parity", {"mark", 3, 1}},        {"bits", {"7", 7, 8}},
      {"stopbits", {"2", 2, 1}},       {"mode", {"RS-422", 2, 1}},        {"gap", {"90", 90, 40}},
      {"hex_tokens", {"true", 1, 0}},  {"token_queue_size", {"9", 9, 4}},
  };
  for (const Row& row : Settings()) {
    const MemoryTypeRow* memoryType = FindMemoryType(TheSpan(row[2]));
    ASSERT_NE(memoryType, nullptr) << row[2];
    const std::string key = TheSpan(row[1]);
    const bool isText = memoryType->naturalType == ICU_BYTE;
    const Values values = isText ? Values{"0A", 0, 0} : kValues.at(key);
    const std::string configured = isText ? "0A" : ValueOf(*memoryType, values.code);
    const std::string applied = isText ? "0B" : ValueOf(*memoryType, values.applied);

    DriverInUse use;
    ASSERT_TRUE(use.Start("CfgVer=1 " + key + "=" + values.configured + " " + kKeys));
    std::string value;
    ASSERT_TRUE(use.Read(UriOf(*memoryType), value)) << key;
    EXPECT_EQ(value.substr(0, configured.size()), configured) << key;
    ASSERT_TRUE(use.Write(UriOf(*memoryType), applied)) << key;
    EXPECT_EQ(use.Host().Storage().Dump(), "") << key;
    ASSERT_TRUE(use.Write("0?SP_Done?boolean", "\x01"));
    EXPECT_EQ(use.Host().Storage().Dump().find("LOKA " + TheSpan(row[3]) + " = "), 0U)
        << use.Host().Storage().Dump();
  }
}

// The numbers said are accepted and no other one is; the text said is the one recorded.
TEST_F(ManualSettingsTest, TheValuesAcceptedAreThoseOfTheDriver) {
  for (const Row& row : Settings()) {
    const MemoryTypeRow* memoryType = FindMemoryType(TheSpan(row[2]));
    ASSERT_NE(memoryType, nullptr) << row[2];
    if (row[5] == "hex text") continue;
    DriverInUse use;
    ASSERT_TRUE(use.Start(kConfig));
    const std::string before = use.Driver().GetLastErrorString();
    std::vector<int> candidates;
    for (int value = 0; value < 256; ++value) candidates.push_back(value);
    for (const int rate : {300, 600, 1200, 2400, 4800, 9600, 14400, 19200, 38400, 57600, 115000,
                           115200, 115201, 230400, -1}) {
      if (memoryType->naturalType == ICU_UNSIGNED_INT) candidates.push_back(rate);
    }
    std::string accepted;
    for (const int value : candidates) {
      if (!use.Write(UriOf(*memoryType), ValueOf(*memoryType, value))) continue;
      accepted += (accepted.empty() ? "" : ", ") + std::to_string(value);
    }
    if (row[5].compare(0, 3, "any") == 0) {
      EXPECT_EQ(static_cast<std::size_t>(std::count(accepted.begin(), accepted.end(), ',')) + 1,
                candidates.size())
          << row[2];
      EXPECT_EQ(row[6], "");
      continue;
    }
    EXPECT_EQ(row[5], accepted) << row[2];
    if (row[6] == "**fails without a text**") {
      EXPECT_EQ(use.Driver().GetLastErrorString(), before) << row[2];
    } else {
      EXPECT_EQ(TheSpan(row[6]), use.Driver().GetLastErrorString()) << row[2];
    }
  }
}

TEST_F(ManualSettingsTest, TheFramingTextsAreChecked) {
  int count = 0;
  for (const Row& row : Settings()) {
    if (row[5] != "hex text") continue;
    DriverInUse use;
    ASSERT_TRUE(use.Start(kConfig));
    const std::string uri = "0?" + TheSpan(row[2]) + "?string-8";
    for (const char* text : {"", "none", "0d0A"}) EXPECT_TRUE(use.Write(uri, text)) << text;
    for (const char* text : {"0", "0x0D", "0D 0A", "0G"}) {
      EXPECT_FALSE(use.Write(uri, text)) << text;
      EXPECT_EQ(TheSpan(row[6]), use.Driver().GetLastErrorString());
    }
    ++count;
  }
  EXPECT_EQ(count, 4);
}

// The table of who changes what and how long it lasts, row by row.
TEST_F(ManualSettingsTest, WhatIsStagedWhatIsStoredAndWhatIsNot) {
  DriverInUse use;
  ASSERT_TRUE(use.Start(kConfig));
  const auto gap = [&use] {
    std::string bytes;
    EXPECT_TRUE(use.Read("0?SP_Gap?unsignedInt", bytes));
    return static_cast<int>(static_cast<unsigned char>(bytes[0]));
  };
  // The gap in use is the time-out of a received byte.
  const auto gapInUse = [&use] {
    use.Host().Log().Take();
    use.Host().RunPasses(1);
    const std::string calls = use.Host().Log().Take();
    const std::size_t at = calls.find("Receive ");
    return at == std::string::npos ? calls : calls.substr(at + 8, calls.find(' ', at + 8) - at - 8);
  };
  const auto restart = [&use] {
    use.Driver().Stop();
    EXPECT_NE(use.Driver().Start(), 0);
  };
  bool result = false;
  EXPECT_EQ(use.Command("set_rxGap 30", result), "OK");
  EXPECT_EQ(gapInUse(), "30");
  EXPECT_EQ(gap(), 0);
  restart();
  EXPECT_EQ(gapInUse(), "500");
  ASSERT_TRUE(use.Write("0?SP_Gap?unsignedInt", "\x28"));
  EXPECT_EQ(gap(), 40);
  EXPECT_EQ(gapInUse(), "500");
  restart();
  EXPECT_EQ(gap(), 40);
  EXPECT_EQ(gapInUse(), "500");
  ASSERT_TRUE(use.Write("0?SP_Done?boolean", "\x01"));
  EXPECT_EQ(gapInUse(), "40");
  EXPECT_EQ(use.Command("set_rxGap 30", result), "OK");
  EXPECT_EQ(gapInUse(), "30");
  ASSERT_TRUE(use.Write("0?SP_Done?boolean", std::string(1, '\0')));
  EXPECT_EQ(gapInUse(), "40");
  restart();
  EXPECT_EQ(gapInUse(), "40");
  EXPECT_EQ(use.Host().Storage().Dump(), "LOKA gap = 40\n");

  // The stored value beats the configured one for a new instance on the same storage.
  use.Driver().Stop();
  Protocol_LOKA next;
  ASSERT_NE(next.Config((kConfig + " gap=90").c_str()), 0);
  ASSERT_NE(next.Start(), 0);
  use.Host().Log().Take();
  use.Host().RunPasses(1);
  EXPECT_NE(use.Host().Log().Take().find("Receive 40 "), std::string::npos);
  next.Stop();
}

TEST_F(ManualSettingsTest, ApplyingDropsTheTokensThatWaitAndStoppingDoesNot) {
  DriverInUse use;
  ASSERT_TRUE(use.Start(kConfig + " rx_suffix=0D"));
  use.Receive("A\rB\r", "com1");
  EXPECT_EQ(use.TokensAvailable(), 2);
  use.Driver().Stop();
  ASSERT_NE(use.Driver().Start(), 0);
  ASSERT_TRUE(use.Write("0?connect?boolean", std::string(1, '\0')));
  ASSERT_TRUE(use.Write("0?connect?boolean", "\x01"));
  EXPECT_EQ(use.TokensAvailable(), 2);
  ASSERT_TRUE(use.Write("0?SP_Done?boolean", "\x01"));
  EXPECT_EQ(use.TokensAvailable(), 0);
}

}  // namespace
