// SPDX-License-Identifier: Apache-2.0
// sub, send, ask and stats: on a port of their own and beside a running instance.
#include <gtest/gtest.h>

#include <atomic>
#include <nlohmann/json.hpp>
#include <thread>

#include "tests/host/commands/InstanceRun.h"
#include "tests/host/support/TextParts.h"

namespace {

using Json = nlohmann::json;

std::vector<std::string> With(std::vector<std::string> arguments, const std::string& port,
                              const std::string& more) {
  arguments.insert(arguments.end(),
                   {port, "--config", TestConfiguration(more), "--no-attach", "--no-store"});
  return arguments;
}

TEST(SubCommand, PrintsTokensAndEndsAtTheCount) {
  PseudoTerminal line;
  ASSERT_TRUE(
      line.Send("\x02"
                "A\x1B\x03\x02"
                "B\x03\x02"
                "C\x03",
                ProgramRun::Limit()));
  ProgramRun run(With({"sub", "-C", "2"}, line.Path(), "rx_prefix=02 rx_suffix=03"));
  EXPECT_EQ(run.Output(), "A\\x1b\nB\n");
  EXPECT_EQ(run.Status(), 0);
  EXPECT_TRUE(Holds(run.Errors(), "rx 02 ... 03")) << run.Errors();
}

TEST(SubCommand, ShowsFramesHexAndFormats) {
  const std::vector<std::pair<std::vector<std::string>, std::string>> forms = {
      {{"sub", "-q", "-C", "1", "-X"}, "rx 02 41 03   .A.\n"},
      {{"sub", "-q", "-C", "1", "-x"}, "41\n"},
      {{"sub", "-q", "-C", "1", "-F", "%n|%l|%p|%x|%a|%P|%%"}, "1|1|A|41|1|com1|%\n"}};
  for (const auto& [arguments, output] : forms) {
    PseudoTerminal line;
    ASSERT_TRUE(
        line.Send("\x02"
                  "A\x03",
                  ProgramRun::Limit()));
    ProgramRun run(With(arguments, line.Path(), "rx_prefix=02 rx_suffix=03"));
    EXPECT_EQ(run.Output(), output);
    EXPECT_EQ(run.Status(), 0);
    EXPECT_EQ(run.Errors(), "");
  }
}

TEST(SubCommand, SaysTheRoleOfEachByte) {
  PseudoTerminal line;
  ASSERT_TRUE(
      line.Send("x\x02"
                "AB\x03",
                ProgramRun::Limit()));
  ProgramRun run(With({"sub", "-C", "1", "-vv"}, line.Path(), "rx_prefix=02 rx_suffix=03"));
  EXPECT_EQ(run.Output(), "AB\n");
  EXPECT_TRUE(Holds(run.Errors(), "loka: drop no-prefix: 78")) << run.Errors();
  EXPECT_TRUE(Holds(run.Errors(), "loka: 02 prefix  41 42 body  03 suffix\n")) << run.Errors();
}

TEST(SubCommand, ColoursWhereTheyAreAskedFor) {
  PseudoTerminal line;
  ASSERT_TRUE(
      line.Send("x\x02"
                "A\x03",
                ProgramRun::Limit()));
  ProgramRun run(With({"sub", "-C", "1", "-X", "--color", "always"}, line.Path(),
                      "rx_prefix=02 rx_suffix=03"));
  EXPECT_EQ(run.Output(),
            "rx \x1b[2m02\x1b[0m 41 \x1b[2m03\x1b[0m   \x1b[2m.\x1b[0mA\x1b[2m.\x1b[0m\n");
  EXPECT_TRUE(Holds(run.Errors(), "loka: \x1b[31mdrop ")) << run.Errors();
}

TEST(SubCommand, WithoutReconnectTheLossOfTheLineIsStatus6) {
  auto line = std::make_unique<PseudoTerminal>();
  ProgramRun run({"sub", line->Path(), "--no-reconnect", "--no-attach", "--no-store"});
  ASSERT_TRUE(run.AwaitErrors("queue 100")) << run.Errors();
  line.reset();
  EXPECT_EQ(run.Status(), 6) << run.Errors();
  EXPECT_TRUE(Holds(run.Errors(), ": line lost (")) << run.Errors();
}

TEST(SubCommand, SaysWhatWasDroppedAndWhatHelps) {
  PseudoTerminal line;
  ASSERT_TRUE(line.Send("ST,", ProgramRun::Limit()));
  ProgramRun run(With({"sub", "-C", "1"}, line.Path(), "rx_suffix=03 gap=60"));
  ASSERT_TRUE(run.AwaitErrors("drop no-suffix after 60 ms: 53 54 2C  \"ST,\"")) << run.Errors();
  ASSERT_TRUE(line.Send("A\x03", ProgramRun::Limit()));
  EXPECT_EQ(run.Output(), "A\n");
}

TEST(SubCommand, WritesOneObjectALine) {
  PseudoTerminal line;
  ASSERT_TRUE(line.Send("ST,", ProgramRun::Limit()));
  ProgramRun run(With({"sub", "-j", "-C", "1"}, line.Path(), "rx_suffix=03 gap=60"));
  const Json drop = Json::parse(run.Line(), nullptr, false);
  EXPECT_EQ(drop.value("ev", ""), "drop") << drop;
  EXPECT_EQ(drop.value("why", ""), "no-suffix");
  EXPECT_EQ(drop.value("after_ms", 0), 60);
  EXPECT_EQ(drop.value("hex", ""), "53542C");
  ASSERT_TRUE(line.Send(std::string("\xFF\x1B\x03", 3), ProgramRun::Limit()));
  const Json token = Json::parse(run.Line(), nullptr, false);
  EXPECT_EQ(token.value("ev", ""), "token") << token;
  EXPECT_EQ(token.value("hex", ""), "FF1B");
  EXPECT_EQ(token.value("frame", ""), "FF1B03");
  EXPECT_EQ(token.value("len", 0), 2);
  EXPECT_EQ(run.Status(), 0);
}

TEST(SubCommand, EndsWith27WhenTheTokensDoNotComeInTime) {
  PseudoTerminal line;
  ProgramRun run(With({"sub", "-C", "1", "-W", "0.2"}, line.Path(), "rx_suffix=03"));
  EXPECT_EQ(run.Output(), "");
  EXPECT_EQ(run.Status(), 27);
}

TEST(SubCommand, RefusesAFormatItDoesNotKnow) {
  PseudoTerminal line;
  ProgramRun run(With({"sub", "-F", "%z"}, line.Path(), "rx_suffix=03"));
  EXPECT_EQ(run.Status(), 2);
  EXPECT_TRUE(Holds(run.Errors(), "expected %t time")) << run.Errors();
}

TEST(SubCommand, SaysThatAPlainTokenEndsAtItsZeroByte) {
  PseudoTerminal line;
  ASSERT_TRUE(line.Send(std::string("A\0B\x03", 4), ProgramRun::Limit()));
  ProgramRun run(With({"sub", "-C", "1"}, line.Path(), "rx_suffix=03"));
  EXPECT_EQ(run.Output(), "A\n");
  EXPECT_TRUE(Holds(run.Errors(), "3 bytes and a zero byte behind the first 1")) << run.Errors();
}

TEST(SubCommand, BesideAnInstanceThatLeavesTokensItShowsTheOldestAndTakesNone) {
  InstanceRun instance("rx_suffix=03");
  ASSERT_TRUE(instance.IsReady()) << instance.Errors();
  ASSERT_TRUE(
      instance.DeviceSends("A\x03"
                           "B\x03",
                           "2"));
  EXPECT_EQ(instance.Output({"sub", "-q", "-C", "1"}), "A\n");
  EXPECT_EQ(instance.Output({"sub", "-q", "-C", "1"}), "A\n");
  EXPECT_EQ(instance.Output({"write", "0?token_ack?boolean", "1", "-q"}), "");
  EXPECT_EQ(instance.Output({"sub", "-q", "-C", "1"}), "B\n");
  EXPECT_EQ(instance.Output({"read", "0?tokens_available?unsignedInt"}), "1\n");
}

TEST(SubCommand, BesideAnInstanceThatTakesTokensEveryListenerGetsThem) {
  InstanceRun instance("rx_suffix=03", "auto");
  ASSERT_TRUE(instance.IsReady()) << instance.Errors();
  const auto first = instance.Begin({"sub", "-v", "-C", "2"});
  const auto second = instance.Begin({"sub", "-v", "-j", "-C", "2"});
  ASSERT_TRUE(first->AwaitErrors("attached to the running instance com1"));
  ASSERT_TRUE(second->AwaitErrors("attached to the running instance com1"));
  // The device goes on until both have what they asked for.
  std::atomic<bool> isEnough{false};
  std::thread device([&] {
    while (!isEnough.load()) {
      EXPECT_TRUE(instance.Line().Send("A\x03", ProgramRun::Limit()));
      Deadline::After(20).Sleep();
    }
  });
  EXPECT_EQ(first->Output(), "A\nA\n");
  EXPECT_EQ(first->Status(), 0);
  EXPECT_EQ(second->Status(), 0);
  isEnough.store(true);
  device.join();
}

TEST(SendCommand, FramesAndSends) {
  InstanceRun instance("tx_prefix=02 tx_suffix=03");
  ASSERT_TRUE(instance.IsReady()) << instance.Errors();
  EXPECT_EQ(instance.Loka({"send", "-m", "CD"}).status, 0);
  EXPECT_EQ(instance.Loka({"send", "-x", "1B CR LF"}).status, 0);
  std::string bytes;
  ASSERT_TRUE(instance.Line().Receive(9, ProgramRun::Limit(), &bytes));
  EXPECT_EQ(bytes,
            "\x02"
            "CD\x03\x02\x1B\r\n\x03");
  const InstanceRun::Result zero = instance.Loka({"send", "-x", "41 00"});
  EXPECT_EQ(zero.status, 2);
  EXPECT_TRUE(Holds(zero.errors, "hex_tokens=true")) << zero.errors;
}

TEST(SendCommand, ShowsWhatGoesOutWhenItIsVerbose) {
  const PseudoTerminal line;
  ProgramRun own(With({"send", "-v", "-m", "R"}, line.Path(), "tx_suffix=0D"));
  EXPECT_EQ(own.Status(), 0);
  EXPECT_EQ(own.Output(), "");
  EXPECT_TRUE(Holds(own.Errors(), "loka: tx 52 0D  \"R\\r\"\n")) << own.Errors();

  InstanceRun instance("tx_prefix=02 rx_suffix=03");
  ASSERT_TRUE(instance.IsReady()) << instance.Errors();
  ASSERT_TRUE(instance.DeviceSends("waits\x03", "1"));
  const InstanceRun::Result attached = instance.Loka({"send", "-vv", "-m", "AB"});
  EXPECT_EQ(attached.status, 0);
  EXPECT_EQ(attached.output, "");
  EXPECT_TRUE(Holds(attached.errors, "loka: tx 02 41 42  \"\\x02")) << attached.errors;
  EXPECT_EQ(instance.Output({"read", "0?tokens_available?unsignedInt"}), "1\n");
  EXPECT_FALSE(Holds(instance.Loka({"send", "-m", "AB"}).errors, "tx "));
}

TEST(SendCommand, ShowsEachLineThatGoesOut) {
  InstanceRun instance("tx_suffix=0D");
  ASSERT_TRUE(instance.IsReady()) << instance.Errors();
  const auto send = instance.Begin({"send", "-v", "-l"});
  ASSERT_TRUE(send->Type("A"));
  EXPECT_TRUE(send->AwaitErrors("loka: tx 41 0D  \"A\\r\"\n")) << send->Errors();
  ASSERT_TRUE(send->Type("B"));
  EXPECT_TRUE(send->AwaitErrors("loka: tx 42 0D  \"B\\r\"\n")) << send->Errors();
}

TEST(AskCommand, ShowsBothDirectionsWhenItIsVerbose) {
  InstanceRun instance("tx_suffix=0D rx_suffix=03", "auto");
  ASSERT_TRUE(instance.IsReady()) << instance.Errors();
  const auto ask = instance.Begin({"ask", "-vv", "-m", "R", "-W", "20"});
  std::string bytes;
  ASSERT_TRUE(instance.Line().Receive(2, ProgramRun::Limit(), &bytes));
  ASSERT_TRUE(instance.Line().Send("5\x03", ProgramRun::Limit()));
  EXPECT_EQ(ask->Output(), "5\n");
  EXPECT_EQ(ask->Status(), 0);
  EXPECT_TRUE(Holds(ask->Errors(), "loka: tx 52 0D  \"R\\r\"\n")) << ask->Errors();
  EXPECT_TRUE(Holds(ask->Errors(), "loka: 35 body  03 suffix\n")) << ask->Errors();
}

TEST(AskCommand, PrintsTheNextToken) {
  InstanceRun instance("tx_suffix=0D rx_suffix=03", "auto");
  ASSERT_TRUE(instance.IsReady()) << instance.Errors();
  const auto ask = instance.Begin({"ask", "-q", "-m", "R", "-W", "20"});
  std::string bytes;
  ASSERT_TRUE(instance.Line().Receive(2, ProgramRun::Limit(), &bytes));
  EXPECT_EQ(bytes, "R\r");
  ASSERT_TRUE(instance.Line().Send("5.12kg\x03", ProgramRun::Limit()));
  EXPECT_EQ(ask->Output(), "5.12kg\n");
  EXPECT_EQ(ask->Status(), 0);
  EXPECT_EQ(instance.Loka({"ask", "-m", "X", "-W", "0.3"}).status, 27);
}

TEST(StatsCommand, CountsTokensAndDrops) {
  InstanceRun instance("rx_suffix=03 gap=40", "auto");
  ASSERT_TRUE(instance.IsReady()) << instance.Errors();
  ASSERT_TRUE(
      instance.Line().Send("A\x03"
                           "B\x03"
                           "C",
                           ProgramRun::Limit()));
  const Deadline deadline = Deadline::After(ProgramRun::kLimitMs);
  Json counts = Json::object();
  while (counts.value("tokens", 0) < 2 || counts.value("dropped_bytes", 0) < 1) {
    ASSERT_FALSE(deadline.HasPassed()) << counts;
    counts = Json::parse(instance.Output({"stats", "-j"}), nullptr, false);
  }
  EXPECT_EQ(counts["drops"], Json({{"no-suffix", 1}}));
  EXPECT_EQ(counts["findings"], 0);
  EXPECT_EQ(instance.Output({"stats"}),
            "tokens 2  dropped 1 (no-suffix 1)  lost sends 0  reconnects 0  findings 0\n");
}

TEST(StatsCommand, NeedsARunningInstance) {
  InstanceRun instance("");
  ASSERT_TRUE(instance.IsReady()) << instance.Errors();
  EXPECT_EQ(instance.Stop(), 128 + SIGTERM);
  const InstanceRun::Result stats = instance.Loka({"stats"});
  EXPECT_EQ(stats.status, 5);
  EXPECT_TRUE(Holds(stats.errors, "no instance is running")) << stats.errors;
}

}  // namespace
