// SPDX-License-Identifier: Apache-2.0
// What people with serial devices complain about most, and what the program does or says then.
// Complaints that a command or a port option is made for have their tests beside it.
#include <gtest/gtest.h>

#include <filesystem>
#include <memory>
#include <nlohmann/json.hpp>

#include "tests/host/commands/InstanceRun.h"

namespace {

using Json = nlohmann::json;
using Words = std::vector<std::string>;

constexpr int kPauseMs = 60;

Deadline Limit() { return Deadline::After(ProgramRun::kLimitMs); }

Words Sub(const PseudoTerminal& line, const std::string& more, const Words& options) {
  Words words = {"sub",         line.Path(), "--config", TestConfiguration(more),
                 "--no-attach", "--no-store"};
  words.insert(words.end(), options.begin(), options.end());
  return words;
}

// "My line arrives in pieces."
TEST(Complaints, ALineThatArrivesInPiecesIsOneToken) {
  const PseudoTerminal line;
  ProgramRun run(Sub(line, "rx_suffix=0D0A gap=20000", {"-C", "1"}));
  ASSERT_TRUE(run.AwaitErrors("queue 100")) << run.Errors();
  for (const char* const piece : {"ST,GS", "+  5.1", "2kg\r", "\n"}) {
    ASSERT_TRUE(line.Send(piece, Limit()));
    Deadline::After(kPauseMs).Sleep();
  }
  EXPECT_EQ(run.Output(), "ST,GS+  5.12kg\n");
}

// "Half a message is thrown away without a word." A slow line, typed by hand: the gap ends it.
TEST(Complaints, TheGapThatEndsALineWithASuffixIsNamedWithTheOptionThatHelps) {
  const PseudoTerminal line;
  ProgramRun run(Sub(line, "rx_suffix=0D", {"-C", "1"}));
  ASSERT_TRUE(run.AwaitErrors("queue 100")) << run.Errors();
  ASSERT_TRUE(line.Send("AB", Limit()));
  EXPECT_TRUE(run.AwaitErrors("drop no-suffix after 500 ms: 41 42")) << run.Errors();
  EXPECT_TRUE(run.AwaitErrors("a longer --gap allows")) << run.Errors();
}

struct DropCase {
  const char* name;
  const char* configuration;
  std::string bytes;
  const char* reason;
  const char* hint;
};

class DropComplaints : public testing::TestWithParam<DropCase> {};

TEST_P(DropComplaints, EveryLostByteHasItsReason) {
  const DropCase& entry = GetParam();
  InstanceRun instance(entry.configuration);
  ASSERT_TRUE(instance.IsReady()) << instance.Errors();
  const auto sub = instance.Begin({"sub"});
  ASSERT_TRUE(sub->AwaitErrors("attached")) << sub->Errors();
  ASSERT_TRUE(instance.Line().Send(entry.bytes, Limit()));
  EXPECT_TRUE(sub->AwaitErrors(std::string("drop ") + entry.reason)) << sub->Errors();
  EXPECT_TRUE(sub->AwaitErrors(entry.hint)) << sub->Errors();
  const Json stats = Json::parse(instance.Output({"stats", "-j"}));
  EXPECT_GE(stats["drops"].value(entry.reason, 0), 1) << stats;
}

INSTANTIATE_TEST_SUITE_P(
    Reasons, DropComplaints,
    testing::Values(DropCase{"NoSuffix", "rx_suffix=03 gap=60", "AB", "no-suffix", "--gap"},
                    DropCase{"NoPrefix", "rx_prefix=02 rx_suffix=03 gap=60", "xy", "no-prefix",
                             "in front of the prefix"},
                    DropCase{"PartialPrefix", "rx_prefix=0202 rx_suffix=03 gap=60", "\x02",
                             "partial-prefix", "--gap"},
                    DropCase{"TooLong", "rx_suffix=03 gap=2000", std::string(1200, 'x'),
                             "over-1000", "1000"}),
    [](const auto& entry) { return std::string(entry.param.name); });

// "The scale shows old values": a queue of one token always holds the newest.
TEST(Complaints, AQueueOfOneHoldsTheNewestValueAndTheOthersAreCounted) {
  InstanceRun instance("rx_suffix=03 token_queue_size=1");
  ASSERT_TRUE(instance.IsReady()) << instance.Errors();
  ASSERT_TRUE(instance.DeviceSends("1\x03", "1"));
  ASSERT_TRUE(instance.Line().Send("2\x03\x33\x03", Limit()));
  const Deadline deadline = Limit();
  std::string value;
  while (value != "3\n" && !deadline.HasPassed()) {
    value = instance.Output({"read", "0?rx_token?string-16"});
  }
  EXPECT_EQ(value, "3\n");
  EXPECT_EQ(instance.Output({"read", "0?tokens_available?unsignedInt"}), "1\n");
}

// "It missed a scan": two equal codes, one behind the other, are two tokens.
TEST(Complaints, EqualTokensAreTakenOneByOne) {
  const PseudoTerminal line;
  ASSERT_TRUE(line.Send("4006381333931\r4006381333931\r", Limit()));
  ProgramRun run(Sub(line, "rx_suffix=0D", {"-C", "2", "-F", "%n %p"}));
  EXPECT_EQ(run.Output(), "1 4006381333931\n2 4006381333931\n");
}

// "It does not come back", for what was sent meanwhile: the driver says nothing, the program
// counts.
TEST(Complaints, ASendOnALostLineIsToldAndCounted) {
  const TemporaryFolder folder;
  auto device = std::make_unique<PseudoTerminal>();
  const std::string link = folder.File("port");
  std::filesystem::create_symlink(device->Path(), link);
  const std::string environment = "LOKA_RUNTIME_DIR='" + folder.File("control") + "'";
  ProgramRun run({"run", link, "--config", TestConfiguration("rx_suffix=03"), "--no-store"},
                 environment);
  ASSERT_TRUE(run.AwaitErrors("commands attach at")) << run.Errors();
  device.reset();
  ASSERT_TRUE(run.AwaitErrors("line lost")) << run.Errors();
  ProgramRun send({"send", "-m", "R"}, environment);
  EXPECT_EQ(send.Output(), "");
  EXPECT_EQ(send.Status(), 1) << send.Errors();
  ProgramRun stats({"stats", "-j"}, environment);
  EXPECT_EQ(Json::parse(stats.Output()).value("lost_sends", 0), 1);
}

}  // namespace
