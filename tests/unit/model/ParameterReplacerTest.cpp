// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <string>

#include "interfaces/IPermanentStorage2.h"
#include "model/ParameterReplacer.h"
#include "tests/unit/HostInUse.h"

namespace {

std::string TextOf(ParameterReplacer& active, const char* name, const std::string& byDefault,
                   int node = kNoNode) {
  std::string value = "former";
  active.get(name, node, byDefault, value);
  return value;
}

int NumberOf(ParameterReplacer& active, const char* name, int byDefault, int node = kNoNode) {
  int value = -4711;
  active.get(name, node, byDefault, value);
  return value;
}

bool SwitchOf(ParameterReplacer& active, const char* name, bool byDefault, int node = kNoNode) {
  bool value = !byDefault;
  active.get(name, node, byDefault, value);
  return value;
}

class ParameterReplacerTest : public testing::Test {
 protected:
  ParameterReplacerTest() { active_.setIdent("line"); }

  HostInUse host_;
  ParameterReplacer active_;
};

}  // namespace

TEST(ParameterReplacerNamesTest, FullNames) {
  EXPECT_EQ(ParameterReplacer::makeFullName("baud", -1), "baud");
  EXPECT_EQ(ParameterReplacer::makeFullName("baud", 12), "node12_baud");
  EXPECT_EQ(ParameterReplacer::makeFullName("baud", 3), "node3_baud");
  EXPECT_EQ(ParameterReplacer::makeFullName("baud", 0), "node0_baud");
  EXPECT_EQ(ParameterReplacer::makeFullName("baud", -2), "node-2_baud");
}

TEST(ParameterReplacerNamesTest, EmptyValueIsAllZero) {
  const ParameterReplacer::Variant value;
  EXPECT_EQ(value.type, 0);
  EXPECT_FALSE(value.boolValue);
  EXPECT_EQ(value.intValue, 0);
  EXPECT_EQ(value.stringValue, "");
}

TEST(ParameterReplacerNamesTest, KindsHaveTheirNumbers) {
  EXPECT_EQ(kBooleanParameter, 0);
  EXPECT_EQ(kIntegerParameter, 1);
  EXPECT_EQ(kStringParameter, 2);
}

TEST_F(ParameterReplacerTest, WithoutStorageTheDefaultIsTaken) {
  piPermanentStorage = nullptr;
  EXPECT_EQ(TextOf(active_, "rx_prefix", "02"), "02");
  EXPECT_EQ(NumberOf(active_, "baud", 9600), 9600);
  EXPECT_TRUE(SwitchOf(active_, "hex_tokens", true));
  EXPECT_EQ(host_->Log().Text(), "");
}

TEST_F(ParameterReplacerTest, MissingKeyGivesTheDefaultAndIsOnlyAskedForOnce) {
  EXPECT_EQ(NumberOf(active_, "baud", 9600), 9600);
  EXPECT_EQ(host_->Log().Take(), "Exists line baud -> 0\n");
  // The first default stays, whatever the storage holds meanwhile.
  host_->Storage().Put("line", "baud", 300);
  EXPECT_EQ(NumberOf(active_, "baud", 1200), 9600);
  EXPECT_EQ(host_->Log().Take(), "");
}

TEST_F(ParameterReplacerTest, MissingTextAndSwitchKeepTheFirstDefault) {
  EXPECT_EQ(TextOf(active_, "rx_prefix", "02"), "02");
  EXPECT_EQ(TextOf(active_, "rx_prefix", "03"), "02");
  EXPECT_TRUE(SwitchOf(active_, "hex_tokens", true));
  EXPECT_TRUE(SwitchOf(active_, "hex_tokens", false));
}

TEST_F(ParameterReplacerTest, StoredValuesWin) {
  host_->Storage().Put("line", "baud", 300);
  host_->Storage().PutBoolean("line", "hex_tokens", true);
  host_->Storage().PutString("line", "rx_prefix", "0D");
  EXPECT_EQ(NumberOf(active_, "baud", 9600), 300);
  EXPECT_TRUE(SwitchOf(active_, "hex_tokens", false));
  EXPECT_EQ(TextOf(active_, "rx_prefix", "02"), "0D");
}

TEST_F(ParameterReplacerTest, AsksTheStorageInOrder) {
  host_->Storage().Put("line", "baud", 300);
  host_->Storage().PutBoolean("line", "hex_tokens", true);
  host_->Storage().PutString("line", "rx_prefix", "0D");
  NumberOf(active_, "baud", 9600);
  EXPECT_EQ(host_->Log().Take(), "Exists line baud -> 1\nGetInteger line baud -> 300\n");
  SwitchOf(active_, "hex_tokens", false);
  EXPECT_EQ(host_->Log().Take(),
            "Exists line hex_tokens -> 1\nGetBoolean line hex_tokens -> true\n");
  TextOf(active_, "rx_prefix", "02");
  EXPECT_EQ(host_->Log().Take(),
            "Exists line rx_prefix -> 1\nConvertTo IPermanentStorage2 -> 0\n"
            "GetString line rx_prefix -> 0D\n");
  TextOf(active_, "rx_prefix", "02");
  EXPECT_EQ(host_->Log().Take(), "");
}

TEST_F(ParameterReplacerTest, IdentIsTheKeySpace) {
  host_->Storage().Put("line", "baud", 300);
  host_->Storage().Put("", "baud", 150);
  ParameterReplacer other;
  EXPECT_EQ(NumberOf(other, "baud", 9600), 150);
  ParameterReplacer another;
  another.setIdent("elsewhere");
  EXPECT_EQ(NumberOf(another, "baud", 9600), 9600);
}

TEST_F(ParameterReplacerTest, CachedValueOutlivesAChangeOfTheIdent) {
  EXPECT_EQ(NumberOf(active_, "baud", 9600), 9600);
  host_->Storage().Put("elsewhere", "baud", 300);
  active_.setIdent("elsewhere");
  EXPECT_EQ(NumberOf(active_, "baud", 1200), 9600);
}

TEST_F(ParameterReplacerTest, NodesHaveKeysOfTheirOwn) {
  host_->Storage().Put("line", "node3_baud", 300);
  EXPECT_EQ(NumberOf(active_, "baud", 9600, 3), 300);
  EXPECT_EQ(NumberOf(active_, "baud", 9600), 9600);
}

// --- the extended storage ---

TEST_F(ParameterReplacerTest, ExtendedStorageIsTheOnlyOneAskedForTexts) {
  host_->Storage().SetExtended(true);
  host_->Storage().PutString("line", "rx_prefix", "0D");
  EXPECT_EQ(TextOf(active_, "rx_prefix", "02"), "0D");
  EXPECT_EQ(host_->Log().Take(),
            "Exists line rx_prefix -> 1\nConvertTo IPermanentStorage2 -> 1\n"
            "GetStringInto line rx_prefix 256 -> 1\n");
}

TEST_F(ParameterReplacerTest, FailedExtendedReadGivesTheEmptyText) {
  host_->Storage().SetExtended(true);
  host_->Storage().PutString("line", "rx_prefix", "0D");
  host_->Faults().FailAlways("GetStringInto");
  EXPECT_EQ(TextOf(active_, "rx_prefix", "02"), "");
  // And that is kept.
  host_->Faults().Clear();
  EXPECT_EQ(TextOf(active_, "rx_prefix", "02"), "");
}

TEST_F(ParameterReplacerTest, NumbersAndSwitchesNeverUseTheExtendedStorage) {
  host_->Storage().SetExtended(true);
  host_->Storage().Put("line", "baud", 300);
  host_->Storage().PutBoolean("line", "hex_tokens", true);
  NumberOf(active_, "baud", 9600);
  SwitchOf(active_, "hex_tokens", false);
  EXPECT_EQ(host_->Log().Text().find("ConvertTo"), std::string::npos);
}

TEST_F(ParameterReplacerTest, ExtendedTextsHaveAtMost255Bytes) {
  host_->Storage().SetExtended(true);
  const std::string longest(255, 'A');
  host_->Storage().PutString("line", "rx_prefix", longest);
  host_->Storage().PutString("line", "rx_suffix", longest + 'A');
  EXPECT_EQ(TextOf(active_, "rx_prefix", "02"), longest);
  EXPECT_EQ(TextOf(active_, "rx_suffix", "02"), "");
}

TEST_F(ParameterReplacerTest, PlainTextsMayBeLonger) {
  const std::string text(1000, 'A');
  host_->Storage().PutString("line", "rx_prefix", text);
  EXPECT_EQ(TextOf(active_, "rx_prefix", "02"), text);
}

TEST_F(ParameterReplacerTest, TextWithoutItsZeroEndsWithTheBuffer) {
  host_->Storage().SetExtended(true);
  host_->Storage().SetUnterminated(true);
  host_->Storage().PutString("line", "rx_prefix", "x");
  EXPECT_EQ(TextOf(active_, "rx_prefix", "02"), std::string(256, 'A'));
}

TEST_F(ParameterReplacerTest, StorageThatGivesNoTextGivesTheEmptyText) {
  host_->Storage().Put("line", "rx_prefix", 5);  // there, but no text
  EXPECT_EQ(TextOf(active_, "rx_prefix", "02"), "");
}

// --- values of another type, and put ---

TEST_F(ParameterReplacerTest, ValueOfAnotherTypeGivesItsZero) {
  EXPECT_EQ(TextOf(active_, "a", "text"), "text");
  EXPECT_EQ(NumberOf(active_, "a", 5), 0);
  EXPECT_FALSE(SwitchOf(active_, "a", true));
  EXPECT_EQ(NumberOf(active_, "b", 5), 5);
  EXPECT_EQ(TextOf(active_, "b", "text"), "");
  EXPECT_TRUE(SwitchOf(active_, "c", true));
  EXPECT_EQ(TextOf(active_, "c", "text"), "");
  EXPECT_EQ(NumberOf(active_, "c", 5), 0);
}

TEST_F(ParameterReplacerTest, PutReplacesTheValue) {
  EXPECT_EQ(NumberOf(active_, "baud", 9600), 9600);
  active_.put("baud", {kIntegerParameter, false, 300, ""}, false);
  EXPECT_EQ(NumberOf(active_, "baud", 9600), 300);
  EXPECT_EQ(host_->Storage().Dump(), "");
}

TEST_F(ParameterReplacerTest, PutStoresByType) {
  active_.put("a", {kBooleanParameter, true, 0, ""}, true);
  active_.put("b", {kIntegerParameter, false, -5, ""}, true);
  active_.put("c", {kStringParameter, false, 0, "0D"}, true);
  EXPECT_EQ(host_->Log().Text(),
            "SetBoolean line a true\nSetInteger line b -5\nSetString line c 0D\n");
}

TEST_F(ParameterReplacerTest, PutWithoutStorageOnlyReplaces) {
  piPermanentStorage = nullptr;
  active_.put("baud", {kIntegerParameter, false, 300, ""}, true);
  EXPECT_EQ(NumberOf(active_, "baud", 9600), 300);
  EXPECT_EQ(host_->Log().Text(), "");
}

TEST_F(ParameterReplacerTest, ValuePutWhileTheStorageIsAskedStays) {
  // Plays a second thread that activates a value while the first one waits for the storage.
  class SlowStorage final : public IPermanentStorage {
   public:
    explicit SlowStorage(ParameterReplacer& active) : active_(active) {}
    void* ConvertTo(const char* /*name*/) override { return nullptr; }
    const char* GetImpName() const override { return "Slow"; }
    int GetImpVersion() const override { return 1; }
    void SetString(const char* /*i*/, const char* /*k*/, const char* /*t*/) override {}
    void SetBoolean(const char* /*i*/, const char* /*k*/, bool /*v*/) override {}
    void SetInteger(const char* /*i*/, const char* /*k*/, int /*v*/) override {}
    const char* GetString(const char* /*i*/, const char* /*k*/) override { return nullptr; }
    bool GetBoolean(const char* /*i*/, const char* /*k*/) override { return false; }
    int GetInteger(const char* /*i*/, const char* /*k*/) override {
      active_.put("baud", {kIntegerParameter, false, 300, ""}, false);
      return 150;
    }
    int Exists(const char* /*i*/, const char* /*k*/) override { return 1; }

   private:
    ParameterReplacer& active_;
  };
  SlowStorage storage(active_);
  piPermanentStorage = &storage;
  EXPECT_EQ(NumberOf(active_, "baud", 9600), 300);
}
