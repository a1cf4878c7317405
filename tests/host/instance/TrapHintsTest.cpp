// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "host/instance/TrapHints.h"

namespace {

using Lines = std::vector<std::string>;

TEST(TrapHints, SayHowMuchRoomATokenNeeds) {
  EXPECT_EQ(HintsForLongToken("token too long", 14),
            Lines{"14 bytes waiting, use string-15 or longer"});
  EXPECT_TRUE(HintsForLongToken("Protocol not started", 14).empty());
}

TEST(TrapHints, SayWhereAZeroByteCutsAToken) {
  EXPECT_TRUE(HintsForCutToken(5, 5).empty());
  EXPECT_EQ(HintsForCutToken(2, 5).front(),
            "the token has 5 bytes and a zero byte behind the first 2; a text tag ends there");
}

TEST(TrapHints, CountClearedTokens) {
  EXPECT_EQ(HintForClearedTokens(1), "1 waiting token cleared: SP_Done empties the queue");
  EXPECT_EQ(HintForClearedTokens(12), "12 waiting tokens cleared: SP_Done empties the queue");
  Answer answer;
  answer.data["cleared"] = 12;
  answer.hints = {HintForClearedTokens(12), "another"};
  DropClearedHint(&answer);
  EXPECT_EQ(answer.hints, Lines{"another"});
}

TEST(TrapHints, SayThatTheConsoleStoresNothing) {
  EXPECT_EQ(HintsForConsole("set_rxGap 5", "OK"),
            Lines{"in effect until the driver is restarted and never stored; loka set keeps a "
                  "setting"});
  EXPECT_TRUE(HintsForConsole("set_rxGap x", "ERROR: wrong value").empty());
  EXPECT_TRUE(HintsForConsole("get_stat", "Connected").empty());
}

TEST(TrapHints, SayWhatAnAddressLooksLike) {
  EXPECT_NE(HintsForUri("baud").front().find("NODE?MEMORYTYPE?DATATYPE"), std::string::npos);
  EXPECT_NE(HintsForUri("0?baud?int").front().find("loka tags"), std::string::npos);
}

}  // namespace
