// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <string>

#include "model/GroupParameterReplacer.h"
#include "model/ParameterReplacer.h"
#include "tests/unit/HostInUse.h"

namespace {

class GroupParameterReplacerTest : public testing::Test {
 protected:
  GroupParameterReplacerTest() { active_.setIdent("line"); }

  // The active value, or the given one when none is cached.
  int Active(const char* name, int byDefault) {
    int value = 0;
    active_.get(name, kNoNode, byDefault, value);
    return value;
  }

  HostInUse host_;
  GroupParameterReplacer staged_;
  ParameterReplacer active_;
};

}  // namespace

TEST_F(GroupParameterReplacerTest, FullNamesHaveNoSeparator) {
  EXPECT_EQ(GroupParameterReplacer::makeFullName("baud", -1), "baud");
  EXPECT_EQ(GroupParameterReplacer::makeFullName("baud", 12), "baud12");
  EXPECT_EQ(GroupParameterReplacer::makeFullName("baud", 3), "baud3");
  EXPECT_EQ(GroupParameterReplacer::makeFullName("baud", 0), "baud0");
  EXPECT_EQ(GroupParameterReplacer::makeFullName("baud", -2), "baud-2");
}

TEST_F(GroupParameterReplacerTest, EmptyValueIsAllZero) {
  const GroupParameterReplacer::Variant value;
  EXPECT_EQ(value.type, 0);
  EXPECT_EQ(value.name, "");
  EXPECT_FALSE(value.boolValue);
  EXPECT_EQ(value.intValue, 0);
  EXPECT_EQ(value.stringValue, "");
  EXPECT_EQ(value.node, 0);
}

TEST_F(GroupParameterReplacerTest, NothingStagedChangesNothing) {
  std::string text = "former";
  int number = 4711;
  bool flag = true;
  EXPECT_FALSE(staged_.get("a", -1, text));
  EXPECT_FALSE(staged_.get("a", -1, number));
  EXPECT_FALSE(staged_.get("a", -1, flag));
  EXPECT_EQ(text, "former");
  EXPECT_EQ(number, 4711);
  EXPECT_TRUE(flag);
}

TEST_F(GroupParameterReplacerTest, GivesBackWhatIsStaged) {
  staged_.set("t", -1, "0D");
  staged_.set("n", -1, -5);
  staged_.set("b", -1, true);
  std::string text;
  int number = 0;
  bool flag = false;
  EXPECT_TRUE(staged_.get("t", -1, text));
  EXPECT_TRUE(staged_.get("n", -1, number));
  EXPECT_TRUE(staged_.get("b", -1, flag));
  EXPECT_EQ(text, "0D");
  EXPECT_EQ(number, -5);
  EXPECT_TRUE(flag);
}

TEST_F(GroupParameterReplacerTest, LastStagedValueStays) {
  staged_.set("baud", -1, 300);
  staged_.set("baud", -1, 600);
  int number = 0;
  EXPECT_TRUE(staged_.get("baud", -1, number));
  EXPECT_EQ(number, 600);
}

TEST_F(GroupParameterReplacerTest, NewTypeReplacesTheOldOne) {
  staged_.set("a", -1, 300);
  staged_.set("a", -1, "text");
  int number = 4711;
  EXPECT_TRUE(staged_.get("a", -1, number));
  EXPECT_EQ(number, 0);
  staged_.set("a", -1, true);
  std::string text = "former";
  EXPECT_TRUE(staged_.get("a", -1, text));
  EXPECT_EQ(text, "");
}

TEST_F(GroupParameterReplacerTest, NodesHaveKeysOfTheirOwn) {
  staged_.set("baud", 3, 300);
  int number = 0;
  EXPECT_FALSE(staged_.get("baud", -1, number));
  EXPECT_TRUE(staged_.get("baud", 3, number));
  // The key of a node is the name with the number behind it, so these two are one key.
  EXPECT_TRUE(staged_.get("baud3", -1, number));
  EXPECT_EQ(number, 300);
}

TEST_F(GroupParameterReplacerTest, CopyIsASnapshot) {
  staged_.set("baud", -1, 300);
  const GroupParameterReplacer snapshot(staged_);
  staged_.set("baud", -1, 600);
  staged_.set("gap", -1, 7);
  int number = 0;
  EXPECT_TRUE(snapshot.get("baud", -1, number));
  EXPECT_EQ(number, 300);
  EXPECT_FALSE(snapshot.get("gap", -1, number));
}

TEST_F(GroupParameterReplacerTest, ActivatesInTheOrderOfTheKeys) {
  staged_.set("token_queue_size", -1, 7);
  staged_.set("rx_prefix", -1, "02");
  staged_.set("hex_tokens", -1, true);
  staged_.set("baud", -1, 300);
  staged_.set("bits", -1, 7);
  staged_.activate(active_, -1, true);
  EXPECT_EQ(host_->Log().Text(),
            "SetInteger line baud 300\nSetInteger line bits 7\nSetBoolean line hex_tokens true\n"
            "SetString line rx_prefix 02\nSetInteger line token_queue_size 7\n");
}

TEST_F(GroupParameterReplacerTest, KeysAreOrderedByBytes) {
  staged_.set("b", -1, 1);
  staged_.set("B", -1, 1);
  staged_.set("ba", -1, 1);
  staged_.set("\xE4", -1, 1);
  staged_.set("_", -1, 1);
  staged_.activate(active_, -1, true);
  EXPECT_EQ(host_->Log().Text(),
            "SetInteger line B 1\nSetInteger line _ 1\nSetInteger line b 1\nSetInteger line ba 1\n"
            "SetInteger line \xE4 1\n");
}

TEST_F(GroupParameterReplacerTest, ActivatedValuesReplaceTheActiveOnes) {
  EXPECT_EQ(Active("baud", 9600), 9600);
  staged_.set("baud", -1, 300);
  staged_.activate(active_, -1, true);
  EXPECT_EQ(Active("baud", 9600), 300);
}

TEST_F(GroupParameterReplacerTest, ActivationWithoutPersistingOnlyReplaces) {
  staged_.set("baud", -1, 300);
  staged_.activate(active_, -1, false);
  EXPECT_EQ(host_->Log().Text(), "");
  EXPECT_EQ(Active("baud", 9600), 300);
}

TEST_F(GroupParameterReplacerTest, ActivationWithoutStorageOnlyReplaces) {
  piPermanentStorage = nullptr;
  staged_.set("baud", -1, 300);
  staged_.activate(active_, -1, true);
  EXPECT_EQ(Active("baud", 9600), 300);
}

TEST_F(GroupParameterReplacerTest, ActivatesOneNodeOnly) {
  staged_.set("baud", 5, 300);
  staged_.set("bits", -1, 7);
  staged_.activate(active_, -1, true);
  EXPECT_EQ(host_->Log().Take(), "SetInteger line bits 7\n");
  staged_.activate(active_, 5, true);
  EXPECT_EQ(host_->Log().Take(), "SetInteger line node5_baud 300\n");
}

TEST_F(GroupParameterReplacerTest, ActivationLeavesTheValuesStaged) {
  staged_.set("baud", -1, 300);
  staged_.activate(active_, -1, true);
  int number = 0;
  EXPECT_TRUE(staged_.get("baud", -1, number));
  EXPECT_EQ(number, 300);
}

TEST_F(GroupParameterReplacerTest, ActivatingNothingDoesNothing) {
  staged_.activate(active_, -1, true);
  EXPECT_EQ(host_->Log().Text(), "");
}

TEST_F(GroupParameterReplacerTest, ActivatedValueHasOnlyTheFieldOfItsType) {
  staged_.set("a", -1, 300);
  staged_.activate(active_, -1, false);
  std::string text = "former";
  active_.get("a", -1, std::string("default"), text);
  EXPECT_EQ(text, "");
  bool flag = true;
  active_.get("a", -1, true, flag);
  EXPECT_FALSE(flag);
}
