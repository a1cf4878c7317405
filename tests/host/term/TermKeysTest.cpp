// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <algorithm>
#include <set>

#include "host/term/TermKeys.h"

namespace {

TEST(TermKeys, EachKeyStandsInTheTableOnceAndIsFound) {
  std::set<char> typed;
  std::set<TermKey> keys;
  for (const TermKeyEntry& entry : kTermKeyTable) {
    EXPECT_TRUE(typed.insert(entry.typed).second) << entry.name;
    EXPECT_TRUE(keys.insert(entry.key).second) << entry.name;
    EXPECT_EQ(FindTermKey(entry.typed), entry.key) << entry.name;
  }
  EXPECT_EQ(keys.size(), static_cast<std::size_t>(TermKey::kSendPrefix) + 1);
}

TEST(TermKeys, CapitalsAreOtherKeysAndMostKeysAreNone) {
  EXPECT_EQ(FindTermKey('a'), TermKey::kAcknowledge);
  EXPECT_EQ(FindTermKey('A'), TermKey::kAcknowledgeAll);
  EXPECT_EQ(FindTermKey('\x14'), TermKey::kSendPrefix);
  for (const char typed : {'Q', 'l', 'x', '\0', '\r', '\x1B', '\xFF'}) {
    EXPECT_EQ(FindTermKey(typed), std::nullopt) << int{typed};
  }
}

TEST(TermKeys, TheListHasALineAKey) {
  const std::string list = TermKeyList();
  EXPECT_EQ(std::count(list.begin(), list.end(), '\n'),
            static_cast<std::ptrdiff_t>(kTermKeyTable.size()));
  EXPECT_NE(list.find("ctrl-t q       quit\n"), std::string::npos) << list;
  EXPECT_NE(list.find("ctrl-t ctrl-t  send a ctrl-t\n"), std::string::npos) << list;
}

}  // namespace
