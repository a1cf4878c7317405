// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "host/base/Deadline.h"
#include "host/port/PseudoTerminal.h"
#include "host/runtime/HostSession.h"
#include "host/runtime/SessionConsole.h"
#include "tests/host/support/PluginConfiguration.h"
#include "tests/host/support/TemporaryFolder.h"
#include "tests/host/support/TestLimit.h"
#include "tests/support/PluginLibrary.h"

namespace {

class SessionConsoleTest : public testing::Test {
 protected:
  HostOptions Options() {
    HostOptions options;
    options.pluginFile = PluginLibrary::DefaultPath();
    std::string error;
    EXPECT_TRUE(options.ports.Add(line_.Path(), &error)) << error;
    return options;
  }

  static void Start(HostSession* session) {
    ASSERT_TRUE(session->Open().IsDone());
    ASSERT_TRUE(session->Configure(TestConfiguration("rx_suffix=03 gap=20")).IsDone());
    ASSERT_TRUE(session->Start().IsDone());
  }

  PseudoTerminal line_;
};

TEST_F(SessionConsoleTest, WorksBeforeTheStart) {
  HostSession session(Options());
  ASSERT_TRUE(session.Open().IsDone());
  SessionConsole console(&session);
  const ConsoleReply info = console.Run("info");
  EXPECT_TRUE(info.isDone);
  EXPECT_EQ(info.text.rfind("Protocol: LOKA (471) v.111\n", 0), 0U) << info.text;
  EXPECT_FALSE(info.isCut);
}

TEST_F(SessionConsoleTest, HandsOnResultAndReply) {
  HostSession session(Options());
  Start(&session);
  SessionConsole console(&session);
  EXPECT_EQ(console.Run("get_stat").text, "Connected");
  const ConsoleReply missing = console.Run("put");
  EXPECT_FALSE(missing.isDone);
  EXPECT_EQ(missing.text, "ERROR: string to send is missing");
  const ConsoleReply wrong = console.Run("set_rxGap soon");
  EXPECT_TRUE(wrong.isDone);
  EXPECT_EQ(wrong.text, "ERROR: wrong value");
  const ConsoleReply unknown = console.Run("HELP");
  EXPECT_FALSE(unknown.isDone);
  EXPECT_EQ(unknown.text, "");
  const ConsoleReply silent = console.Run("deletetags");
  EXPECT_TRUE(silent.isDone);
  EXPECT_EQ(silent.text, "");
}

// The longest prefix that the driver takes reads as 9999 bytes, two characters each.
TEST_F(SessionConsoleTest, LongRepliesFit) {
  HostSession session(Options());
  Start(&session);
  SessionConsole console(&session);
  const ConsoleReply reply = console.Run("read 0?SP_RxPrefix?string-9999");
  EXPECT_TRUE(reply.isDone);
  EXPECT_EQ(reply.text, std::string(19998, '0') + "\n");
  EXPECT_FALSE(reply.isCut);
}

// A tag may be longer than any buffer; the driver fills the rest with zeros.
TEST_F(SessionConsoleTest, RepliesThatDoNotFitAreMarked) {
  HostSession session(Options());
  Start(&session);
  ASSERT_TRUE(line_.Send("A\x03", Deadline::After(kLimitMs)));
  SessionConsole console(&session);
  const Deadline deadline = Deadline::After(kLimitMs);
  while (console.Run("tokens_available").text != "1") {
    ASSERT_FALSE(deadline.HasPassed());
  }
  const ConsoleReply reply = console.Run("read 0?rx_token?string-600000");
  EXPECT_TRUE(reply.isDone);
  EXPECT_TRUE(reply.isCut);
  EXPECT_EQ(reply.text.substr(0, 6), "410000");
  EXPECT_LE(reply.text.size(), static_cast<std::size_t>(SessionConsole::kMaxReplyBytes));
  const ConsoleReply longest = console.Run("read 0?rx_token?string-500000");
  EXPECT_FALSE(longest.isCut);
  EXPECT_EQ(longest.text.size(), 1000001U);
}

TEST_F(SessionConsoleTest, WhatACommandStoresIsStored) {
  const TemporaryFolder folder;
  HostOptions options = Options();
  options.storeFile = folder.File("store.db");
  options.ident = "scale";
  HostSession session(options);
  Start(&session);
  SessionConsole console(&session);
  EXPECT_EQ(console.Run("write 0?SP_Gap?unsignedInt 32000000").text, "written ok\n");
  EXPECT_TRUE(session.Storage()->All("scale").empty());
  EXPECT_EQ(console.Run("write 0?SP_Done?boolean 01").text, "written ok\n");
  EXPECT_EQ(session.Storage()->All("scale").size(), 1U);
}

}  // namespace
