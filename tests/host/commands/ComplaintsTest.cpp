// SPDX-License-Identifier: Apache-2.0
// What people with serial devices complain about most, and what the program does or says then.
// Complaints that a command or a port option is made for have their tests beside it.
#include <gtest/gtest.h>

#include <filesystem>
#include <memory>
#include <nlohmann/json.hpp>

#include "tests/host/commands/InstanceRun.h"
#include "tests/host/support/TextParts.h"

namespace {

using Json = nlohmann::json;
using Words = std::vector<std::string>;

constexpr int kPauseMs = 60;

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
    ASSERT_TRUE(line.Send(piece, ProgramRun::Limit()));
    Deadline::After(kPauseMs).Sleep();
  }
  EXPECT_EQ(run.Output(), "ST,GS+  5.12kg\n");
}

// "Half a message is thrown away without a word." A slow line, typed by hand: the gap ends it.
TEST(Complaints, TheGapThatEndsALineWithASuffixIsNamedWithTheOptionThatHelps) {
  const PseudoTerminal line;
  ProgramRun run(Sub(line, "rx_suffix=0D", {"-C", "1"}));
  ASSERT_TRUE(run.AwaitErrors("queue 100")) << run.Errors();
  ASSERT_TRUE(line.Send("AB", ProgramRun::Limit()));
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
  ASSERT_TRUE(instance.Line().Send(entry.bytes, ProgramRun::Limit()));
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
  ASSERT_TRUE(instance.Line().Send("2\x03\x33\x03", ProgramRun::Limit()));
  const Deadline deadline = ProgramRun::Limit();
  std::string value;
  while (value != "3\n" && !deadline.HasPassed()) {
    value = instance.Output({"read", "0?rx_token?string-16"});
  }
  EXPECT_EQ(value, "3\n");
  const Json stats = Json::parse(instance.Output({"stats", "-j"}));
  EXPECT_EQ(stats["drops"].value("queue-full", 0), 2) << stats;
  EXPECT_EQ(instance.Output({"sub", "-q", "-C", "1"}), "3\n");
  EXPECT_EQ(instance.Output({"read", "0?tokens_available?unsignedInt"}), "1\n");
}

// A newest value that nobody takes away is shown each time it changes.
TEST(Complaints, AQueueOfOneIsWatchedWithoutTakingTokens) {
  const PseudoTerminal line;
  ProgramRun run(Sub(line, "rx_suffix=03 token_queue_size=1", {"--peek", "-q", "-C", "3"}));
  for (const char* const token : {"1\x03", "2\x03", "3\x03"}) {
    ASSERT_TRUE(line.Send(token, ProgramRun::Limit()));
    EXPECT_EQ(run.Line(), std::string(1, token[0]));
  }
  EXPECT_EQ(run.Status(), 0);
}

// "It missed a scan": two equal codes, one behind the other, are two tokens.
TEST(Complaints, EqualTokensAreTakenOneByOne) {
  const PseudoTerminal line;
  ASSERT_TRUE(line.Send("4006381333931\r4006381333931\r", ProgramRun::Limit()));
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

// "I sent it to the wrong device": a port that is not the running one, or not right, never is.
TEST(Complaints, AnotherPortIsNeverTheRunningInstance) {
  InstanceRun instance("rx_suffix=03");
  ASSERT_TRUE(instance.IsReady()) << instance.Errors();
  const PseudoTerminal other;
  for (const auto& [word, status] :
       std::vector<std::pair<std::string, int>>{{"com2=/dev/does-not-exist", 5},
                                                {"com99=" + other.Path(), 2},
                                                {instance.Line().Path() + ",flow=x", 2}}) {
    const InstanceRun::Result result = instance.Loka({"send", word, "-m", "R"});
    EXPECT_EQ(result.status, status) << word << ": " << result.errors;
    EXPECT_FALSE(Holds(result.errors, "attached")) << result.errors;
  }
  EXPECT_EQ(instance.Loka({"send", "com2=" + other.Path(), "--tx-suffix", "03", "-m", "R"}).status,
            0);
  std::string sent;
  EXPECT_TRUE(other.Receive(2, ProgramRun::Limit(), &sent));
  EXPECT_EQ(sent, "R\x03");
  const InstanceRun::Result none = instance.Loka({"stats", "--instance", "com7"});
  EXPECT_EQ(none.status, 5);
  EXPECT_TRUE(Holds(none.errors, "no instance com7 is running")) << none.errors;
  EXPECT_TRUE(Holds(none.errors, "running: com1")) << none.errors;
}

// A log of a service: nothing but what is asked for.
TEST(Complaints, ARunningInstanceSaysOnlyWhatItIsAskedFor) {
  const TemporaryFolder folder;
  const PseudoTerminal line;
  const std::string environment = "LOKA_RUNTIME_DIR='" + folder.File("control") + "'";
  ProgramRun run({"run", line.Path(), "--config", TestConfiguration("rx_suffix=03"), "--no-store"},
                 environment);
  ASSERT_TRUE(run.AwaitErrors("commands attach at")) << run.Errors();
  ProgramRun sub({"sub", "-C", "1"}, environment);
  ASSERT_TRUE(sub.AwaitErrors("attached")) << sub.Errors();
  ASSERT_TRUE(line.Send("A\x03", ProgramRun::Limit()));
  EXPECT_EQ(sub.Output(), "A\n");
  run.Signal(SIGTERM);
  EXPECT_EQ(run.Status(), 128 + SIGTERM);
  EXPECT_FALSE(Holds(run.Errors(), "body")) << run.Errors();
  ProgramRun quiet({"run", line.Path(), "--no-store", "-q"}, environment);
  const Deadline deadline = ProgramRun::Limit();
  int status = -1;
  while (status != 0 && !deadline.HasPassed()) {  // it says nothing when it is ready
    ProgramRun stats({"stats", "-j"}, environment);
    (void)stats.Output();
    status = stats.Status();
  }
  EXPECT_EQ(status, 0);
  quiet.Signal(SIGTERM);
  EXPECT_EQ(quiet.Status(), 128 + SIGTERM);
  EXPECT_EQ(quiet.Errors(), "");
}

// Windows files end lines with CR LF; a folder is no file.
TEST(Complaints, LinesAndFilesToSendAreTakenAsPeopleMeanThem) {
  const PseudoTerminal line;
  const TemporaryFolder folder;
  std::ofstream(folder.File("lines")) << "a\r\nb\n";
  const std::string send = "send " + line.Path() + " --tx-suffix 0D --no-store --no-attach ";
  ChildProcess lines("/bin/sh",
                     {"sh", "-c",
                      "exec \"$0\" " + send + "-l -q <'" + folder.File("lines") + "' --plugin '" +
                          PluginLibrary::DefaultPath() + "' 2>/dev/null",
                      LOKA_PROGRAM_PATH});
  EXPECT_EQ(lines.Wait(ProgramRun::Limit()), 0);
  std::string sent;
  EXPECT_TRUE(line.Receive(4, ProgramRun::Limit(), &sent));
  EXPECT_EQ(sent, "a\rb\r");
  ProgramRun run({"send", line.Path(), "-f", folder.Path().string()});
  EXPECT_EQ(run.Status(), 2);
  EXPECT_TRUE(Holds(run.Errors(), "cannot be read")) << run.Errors();
}

// A script must not take a full disk for success.
TEST(Complaints, AResultThatHasNotGoneOutIsNoSuccess) {
  for (const char* const command :
       {"config new", "ports -j", "--help", "--version", "explain 41", "completion bash"}) {
    ChildProcess process(
        "/bin/sh", {"sh", "-c", std::string("exec \"$0\" ") + command + " >/dev/full 2>/dev/null",
                    LOKA_PROGRAM_PATH});
    EXPECT_EQ(process.Wait(ProgramRun::Limit()), 1) << command;
  }
}

}  // namespace
