// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <chrono>

#include "host/port/PseudoTerminal.h"
#include "host/runtime/HostEvents.h"
#include "host/runtime/HostSession.h"
#include "interfaces/IProtocol.h"
#include "tests/host/port/CountingObserver.h"
#include "tests/host/support/PluginConfiguration.h"
#include "tests/host/support/TemporaryFolder.h"
#include "tests/host/support/TestLimit.h"
#include "tests/support/PluginLibrary.h"

namespace {

class HostSessionTest : public testing::Test {
 protected:
  HostOptions Options() {
    HostOptions options;
    options.pluginFile = PluginLibrary::DefaultPath();
    options.observer = &observer_;
    std::string error;
    EXPECT_TRUE(options.ports.Add("com1=" + line_.Path(), &error)) << error;
    return options;
  }

  PseudoTerminal line_;
  CountingObserver observer_;
};

TEST_F(HostSessionTest, GoesThroughALifeAndLeavesNothingOpen) {
  HostSession session(Options());
  ASSERT_TRUE(session.Open().IsDone());
  EXPECT_STREQ(session.Protocol()->GetIdent(), "LOKA");
  EXPECT_EQ(session.PluginPath(), PluginLibrary::DefaultPath());
  ASSERT_TRUE(session.Configure(TestConfiguration("rx_suffix=03 gap=20")).IsDone());
  ASSERT_TRUE(session.Start().IsDone());
  PosixSerialFactory other(Options().ports, nullptr);
  EXPECT_EQ(other.OpenPort("com1"), nullptr);
  session.Stop();
  EXPECT_NE(other.OpenPort("com1"), nullptr);
}

TEST_F(HostSessionTest, StartsAgainAfterAStopUnlessThePortIsTaken) {
  HostSession session(Options());
  ASSERT_TRUE(session.Open().IsDone());
  ASSERT_TRUE(session.Configure(TestConfiguration("rx_suffix=03 gap=20")).IsDone());
  ASSERT_TRUE(session.Start().IsDone());
  session.Stop();
  PosixSerialFactory other(Options().ports, nullptr);
  ISerialPort* const port = other.OpenPort("com1");
  ASSERT_NE(port, nullptr);
  const HostResult busy = session.Start();
  EXPECT_EQ(busy.status, ExitStatus::kPort);
  EXPECT_EQ(busy.text, "Can't open serial port");
  EXPECT_EQ(busy.problem.kind, PortProblem::Kind::kBusy);
  other.ReleasePort(port);
  EXPECT_TRUE(session.Start().IsDone());
}

TEST_F(HostSessionTest, OneSessionAtATime) {
  HostSession second(Options());
  {
    HostSession first(Options());
    ASSERT_TRUE(first.Open().IsDone());
    EXPECT_EQ(second.Open().text, "another session of this process is open");
  }
  EXPECT_TRUE(second.Open().IsDone());
}

TEST_F(HostSessionTest, SaysWhatTheDriverSaysAboutAConfiguration) {
  HostSession session(Options());
  ASSERT_TRUE(session.Open().IsDone());
  HostResult result = session.Configure("CfgVer=2");
  EXPECT_EQ(result.status, ExitStatus::kConfiguration);
  EXPECT_EQ(result.text, "Parser: unknown format");
  result = session.Configure(TestConfiguration("rx_prefix=2"));
  EXPECT_EQ(result.status, ExitStatus::kConfiguration);
  EXPECT_EQ(result.text, "rx_prefix not in hex format");
}

TEST_F(HostSessionTest, SaysWhatTheDriverSaysAboutATag) {
  HostSession session(Options());
  ASSERT_TRUE(session.Open().IsDone());
  ASSERT_TRUE(session.Configure(TestConfiguration("")).IsDone());
  std::string error;
  EXPECT_EQ(session.CreateTag("0?Connect?boolean", &error), nullptr);
  EXPECT_NE(error.find("Can't access memory type"), std::string::npos) << error;
  const auto tag = session.CreateTag("0?tokens_available?unsignedInt", &error);
  ASSERT_NE(tag, nullptr);
  unsigned int value = 5;
  EXPECT_FALSE(tag->ReadNumber(&value));
  EXPECT_EQ(value, 5U);
  EXPECT_EQ(tag->Error(), "Protocol not started");
}

TEST_F(HostSessionTest, BadRateIsExplained) {
  HostSession session(Options());
  ASSERT_TRUE(session.Open().IsDone());
  ASSERT_TRUE(session
                  .Configure("CfgVer=1 model=1 port=com1 baudrate=12345 parity=none bits=8 "
                             "stopbits=1 mode=RS-232")
                  .IsDone());
  const HostResult result = session.Start();
  EXPECT_EQ(result.status, ExitStatus::kPort);
  EXPECT_EQ(result.problem.kind, PortProblem::Kind::kSettings);
  EXPECT_EQ(result.problem.text.rfind("baud rate 12345 is not one of", 0), 0U);
}

TEST_F(HostSessionTest, TextsThatDoNotFitAreNotWritten) {
  HostSession session(Options());
  ASSERT_TRUE(session.Open().IsDone());
  ASSERT_TRUE(session.Configure(TestConfiguration("gap=20")).IsDone());
  ASSERT_TRUE(session.Start().IsDone());
  std::string error;
  const auto tag = session.CreateTag("0?tx_token?string-5", &error);
  ASSERT_NE(tag, nullptr);
  EXPECT_TRUE(tag->WriteText("abcd"));
  EXPECT_FALSE(tag->WriteText("abcde"));
  EXPECT_FALSE(tag->WriteText(std::string("a\0b", 3)));
  std::string seen;
  EXPECT_TRUE(line_.Receive(4, Deadline::After(kLimitMs), &seen));
  EXPECT_EQ(seen, "abcd");
}

TEST_F(HostSessionTest, OverridesAreStoredAndWinAfterARestart) {
  const TemporaryFolder folder;
  HostOptions options = Options();
  options.storeFile = folder.File("store.db");
  options.ident = "scale";
  {
    HostSession session(options);
    ASSERT_TRUE(session.Open().IsDone());
    ASSERT_TRUE(session.Configure(TestConfiguration("rx_suffix=03 gap=20")).IsDone());
    ASSERT_TRUE(session.Start().IsDone());
    std::string error;
    const auto suffix = session.CreateTag("0?SP_RxSuffix?string-16", &error);
    const auto bits = session.CreateTag("0?SP_Bits?unsignedByte", &error);
    const auto done = session.CreateTag("0?SP_Done?boolean", &error);
    ASSERT_TRUE(suffix->WriteText("0D0A"));
    ASSERT_TRUE(bits->WriteNumber(7));
    EXPECT_TRUE(session.Storage()->All("scale").empty());
    ASSERT_TRUE(done->WriteNumber(1));
    EXPECT_EQ(session.Storage()->All("scale").size(), 2U);
    EXPECT_FALSE(bits->WriteNumber(6));
  }
  HostSession session(options);
  ASSERT_TRUE(session.Open().IsDone());
  ASSERT_TRUE(session.Configure(TestConfiguration("rx_suffix=03 gap=20")).IsDone());
  const HostResult result = session.Start();
  ASSERT_TRUE(result.IsDone()) << result.text << " " << result.problem.text;
  std::string error;
  const auto suffix = session.CreateTag("0?SP_RxSuffix?string-16", &error);
  std::string text;
  ASSERT_TRUE(suffix->ReadText(&text));
  EXPECT_EQ(text, "0D0A");
}

TEST_F(HostSessionTest, StoreThatCannotBeOpenedEndsTheStart) {
  HostOptions options = Options();
  options.storeFile = "/dev/null/store.db";
  HostSession session(options);
  const HostResult result = session.Open();
  EXPECT_EQ(result.status, ExitStatus::kRefused);
  EXPECT_NE(result.text.find("/dev/null"), std::string::npos) << result.text;
}

TEST_F(HostSessionTest, MissingPluginIsAPluginProblem) {
  HostOptions options = Options();
  options.pluginFile = "/nowhere/libLOKA.so";
  HostSession session(options);
  EXPECT_EQ(session.Open().status, ExitStatus::kPlugin);
}

// The receive task sits in a wait that is far longer than the driver waits for it.
TEST_F(HostSessionTest, LongGapDoesNotKeepTheEndWaiting) {
  {
    HostSession session(Options());
    ASSERT_TRUE(session.Open().IsDone());
    ASSERT_TRUE(session.Configure(TestConfiguration("gap=3600000")).IsDone());
    ASSERT_TRUE(session.Start().IsDone());
    while (observer_.Pauses() == 0) {
      std::this_thread::yield();
    }
  }
  HostSession next(Options());
  ASSERT_TRUE(next.Open().IsDone());
  ASSERT_TRUE(next.Configure(TestConfiguration("gap=20")).IsDone());
  EXPECT_TRUE(next.Start().IsDone());
}

}  // namespace
