// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>
#include <iterator>
#include <regex>
#include <sstream>
#include <thread>

#include "tests/host/sim/HostEnd.h"
#include "tests/host/sim/SimProcess.h"
#include "tests/host/support/PluginConfiguration.h"
#include "tests/host/support/TestLimit.h"
#include "tests/support/ReferenceFramer.h"

namespace {

namespace fs = std::filesystem;

constexpr std::size_t kEverything = 100000000;

bool HasLink(const std::string& path) { return fs::is_symlink(fs::symlink_status(path)); }

TEST(SimProgram, PrintsThePathFirstAndEndsWithTheSignal) {
  for (const int signalNumber : {SIGINT, SIGTERM}) {
    ProgramRun sim({"sim", "scale"});
    const std::string path = sim.Line();
    EXPECT_TRUE(std::regex_match(path, std::regex("/dev/pts/[0-9]+"))) << path;
    EXPECT_TRUE(sim.AwaitErrors("rx_prefix=02 rx_suffix=03 tx_suffix=0D0A")) << sim.Errors();
    {
      const HostEnd host(path);
      EXPECT_EQ(host.Read(16, kLimitMs), "\x02ST,GS+  5.12kg\x03");
    }
    sim.Signal(signalNumber);
    EXPECT_EQ(sim.Output(), "");
    EXPECT_EQ(sim.Status(), 128 + signalNumber);
  }
}

TEST(SimProgram, LinkLivesAsLongAsTheDevice) {
  SimProcess sim({"scale"});
  ASSERT_TRUE(HasLink(sim.LinkPath()));
  EXPECT_EQ(sim.Events("port")[0]["path"], fs::read_symlink(sim.LinkPath()).string());
  sim.Run().Signal(SIGTERM);
  EXPECT_EQ(sim.Run().Status(), 128 + SIGTERM);
  EXPECT_FALSE(HasLink(sim.LinkPath()));
}

TEST(SimProgram, ALinkThatIsAFileIsStatus5AndStays) {
  const TemporaryFolder folder;
  std::ofstream(folder.File("file")) << "precious";
  ProgramRun sim({"sim", "scale", "--link", folder.File("file")});
  EXPECT_EQ(sim.Output(), "");
  EXPECT_EQ(sim.Status(), 5);
  EXPECT_NE(sim.Errors().find("is no symbolic link"), std::string::npos) << sim.Errors();
  EXPECT_TRUE(fs::is_regular_file(folder.File("file")));
}

TEST(SimProgram, WrongUsageIsStatus2) {
  const std::vector<std::vector<std::string>> wrong = {
      {},
      {"toaster"},
      {"scale", "--every", "soon"},
      {"scale", "--burst", "0"},
      {"scale", "--count", "0"},
      {"scale", "--drop-suffix", "101%"},
      {"scale", "--split", "0"},
      {"scale", "--too-long", "5%"},
      {"scale", "--prefix", "XYZ"},
      {"scale", "--text", "\\q"},
      {"scale", "--baud", "0"},
      {"scale", "--binary"},
      {"scale", "--unplug-every", "3"},
      {"scale", "--link", "/tmp/x", "--unplug-every", "1", "--unplug-for", "1"}};
  for (std::vector<std::string> arguments : wrong) {
    arguments.insert(arguments.begin(), "sim");
    ProgramRun run(arguments);
    EXPECT_EQ(run.Output(), "");
    EXPECT_EQ(run.Status(), 2) << arguments.back();
    EXPECT_NE(run.Errors(), "");
  }
}

TEST(SimProgram, CountEndsWhenEverythingIsRead) {
  SimProcess sim({"barcode", "--every", "5", "--count", "8"});
  const HostEnd host(sim.LinkPath());
  const std::string bytes = host.Read(kEverything, kLimitMs);
  sim.Finish();
  EXPECT_EQ(sim.Run().Status(), 0);
  EXPECT_EQ(bytes, sim.Wire());
  const auto sent = sim.Events("sent");
  ASSERT_EQ(sent.size(), 8U);
  EXPECT_EQ(sent[0]["text"], sent[1]["text"]);
  EXPECT_EQ(sent[3]["text"],
            "]d201020123456789031726123110LOT7\x1D"
            "21SER42");
  EXPECT_EQ(sent[7]["n"], 8);
  EXPECT_EQ(sent[7]["lost"], 0);
  ASSERT_EQ(sim.Events("end").size(), 1U);
  EXPECT_EQ(sim.Events("end")[0]["sent"], 8);
  EXPECT_NE(sim.Run().Errors().find("sent 8 messages, 0 with a fault"), std::string::npos);
}

TEST(SimProgram, AnswersAndTellsWhatItReceived) {
  SimProcess sim({"scale", "--every", "0", "--count", "2"});
  const HostEnd host(sim.LinkPath());
  ASSERT_TRUE(host.Write("R\r\n"));
  EXPECT_EQ(host.Read(16, kLimitMs), "\x02ST,GS+  5.12kg\x03");
  // Ended by silence.
  ASSERT_TRUE(host.Write("T"));
  EXPECT_EQ(host.Read(4, kLimitMs), "\x02OK\x03");
  sim.Finish();
  EXPECT_EQ(sim.Run().Status(), 0);
  const auto received = sim.Events("received");
  ASSERT_EQ(received.size(), 2U);
  EXPECT_EQ(received[0]["what"], "weight request");
  EXPECT_EQ(received[1]["hex"], "54");
}

TEST(SimProgram, PrinterShowsItsLabelsEscaped) {
  ProgramRun sim({"sim", "printer"});
  const HostEnd host(sim.Line());
  ASSERT_TRUE(host.Write("\x1B[31mLOT 4711\f\x05"));
  EXPECT_EQ(sim.Line(), R"(label  14 bytes  "\x1b[31mLOT 4711\f")");
  EXPECT_EQ(host.Read(9, kLimitMs), "\x02READY,1\x03");
  sim.Signal(SIGTERM);
  EXPECT_EQ(sim.Status(), 128 + SIGTERM);
}

TEST(SimProgram, GoesOnWhenTheHostComesAndGoes) {
  SimProcess sim({"scale", "--every", "10", "--text", "A"});
  for (int round = 0; round < 3; ++round) {
    HostEnd host(sim.LinkPath());
    ASSERT_TRUE(host.IsOpen());
    ASSERT_EQ(host.Read(9, kLimitMs).substr(0, 6), "\x02\x41\x03\x02\x41\x03");
    host.Close();
    ASSERT_TRUE(sim.Await("closed"));
  }
  // What is sent to nobody is lost and does not wait for the next host.
  const auto isForNobody = [](const SimProcess::Json& event) {
    return event["lost"] == 3 && event["wire"] == "" && event["why"] == "closed";
  };
  const HostEnd last(sim.LinkPath());
  ASSERT_TRUE(sim.Await("open"));
  sim.Run().Signal(SIGTERM);
  sim.Finish();
  for (const SimProcess::Json& event : sim.Events("sent")) {
    EXPECT_TRUE(event["lost"] == 0 || isForNobody(event)) << event;
  }
}

// Whether the lock keeps us out too depends on our rights; the device must be there in both cases.
TEST(SimProgram, SurvivesAHostThatWasKilledWithTheLockOn) {
  SimProcess sim({"scale", "--every", "10", "--text", "A"});
  {
    const HostEnd host(sim.LinkPath());
    ASSERT_TRUE(host.Lock());
    ASSERT_EQ(host.Read(3, kLimitMs).substr(0, 3), "\x02\x41\x03");
  }
  ASSERT_TRUE(sim.Await("closed"));
  const Deadline deadline = Deadline::After(kLimitMs);
  std::string bytes;
  while (bytes.empty() && !deadline.HasPassed()) {
    const HostEnd host(sim.LinkPath());
    bytes = host.IsOpen() ? host.Read(3, kLimitMs) : "";
  }
  EXPECT_EQ(bytes.substr(0, 3), "\x02\x41\x03");
}

TEST(SimProgram, NeverWaitsForAHostThatDoesNotRead) {
  // 5000 messages of 202 bytes do not fit into any terminal's buffer.
  SimProcess sim({"scale", "--text", std::string(200, 'x'), "--every", "1", "--burst", "100",
                  "--count", "5000", "--for", "60"});
  HostEnd host(sim.LinkPath());
  ASSERT_TRUE(sim.Await("open"));
  std::thread output([&] { sim.Finish(); });
  ASSERT_TRUE(sim.Run().AwaitErrors("sent 5000 messages")) << sim.Run().Errors();
  output.join();
  EXPECT_EQ(sim.Run().Status(), 0);
  const auto end = sim.Events("end")[0];
  EXPECT_GT(end["lost"], 0);
  EXPECT_EQ(sim.Wire().size() + end["lost_bytes"].get<std::size_t>(), 5000U * 202U);
  const auto sent = sim.Events("sent");
  ASSERT_EQ(sent.size(), 5000U);
  EXPECT_EQ(sent.back()["why"], "full");
}

TEST(SimProgram, UnplugsAndComesBackBehindTheSameLink) {
  SimProcess sim(
      {"scale", "--text", "A", "--every", "10", "--unplug-every", "1", "--unplug-for", "200ms"});
  for (int round = 0; round < 2; ++round) {
    const HostEnd host(sim.LinkPath());
    ASSERT_TRUE(host.IsOpen()) << round;
    // Reads until the plug is pulled.
    const std::string bytes = host.Read(kEverything, kLimitMs);
    EXPECT_NE(bytes.find("\x02\x41\x03"), std::string::npos);
    ASSERT_TRUE(sim.Await("unplugged"));
    ASSERT_TRUE(sim.Await("plugged"));
    EXPECT_EQ(sim.Events("port").back()["path"], fs::read_symlink(sim.LinkPath()).string());
  }
  sim.Run().Signal(SIGTERM);
  sim.Finish();
  const auto sent = sim.Events("sent");
  EXPECT_TRUE(std::any_of(sent.begin(), sent.end(), [](const SimProcess::Json& event) {
    return event.contains("why") && event["why"] == "unplugged";
  }));
}

TEST(SimProgram, TheSeedRepeatsEveryByte) {
  const auto run = [](const char* seed) {
    SimProcess sim({"gauge", "--every", "2", "--count", "30", "--seed", seed, "--noise", "5%",
                    "--flip", "5%", "--split", "2@1ms", "--too-long", "1200@10%"});
    const HostEnd host(sim.LinkPath());
    const std::string bytes = host.Read(kEverything, kLimitMs);
    sim.Finish();
    EXPECT_EQ(bytes, sim.Wire());
    return bytes;
  };
  const std::string first = run("1");
  EXPECT_EQ(run("1"), first);
  EXPECT_NE(run("2"), first);
}

// The bytes that "sub" shows in hexadecimal at the end of a token's line.
std::string TokenOf(const std::string& line) {
  std::string bytes = "(no token)";
  const std::size_t quote = line.rfind('"');
  if (quote != std::string::npos) {
    (void)ParseHexBytes(line.substr(line.find_first_not_of(' ', quote + 1)), &bytes);
  }
  return bytes;
}

struct WatchCase {
  const char* name;
  std::vector<std::string> sim;
  std::string prefix;
  std::string suffix;
};

class SimWatch : public testing::TestWithParam<WatchCase> {};

// The gap is so long that only prefix and suffix count: what the driver makes of the line must then
// be what the framing rules make of the bytes that the simulator says it sent.
TEST_P(SimWatch, EachTokenIsAccountedFor) {
  std::vector<std::string> arguments = GetParam().sim;
  arguments.insert(arguments.end(), {"--every", "10", "--count", "60", "--seed", "3"});
  SimProcess sim(arguments);
  const std::string framing =
      (GetParam().prefix.empty() ? "" : " rx_prefix=" + CompactHex(GetParam().prefix)) +
      " rx_suffix=" + CompactHex(GetParam().suffix);
  ProgramRun sub({"sub", "-F", "%t  %l  \"%p\"  %x", "--port", "com1=" + sim.LinkPath(),
                  "--no-store", "--config",
                  TestConfiguration("gap=60000 hex_tokens=true" + framing)});
  sim.Finish();
  EXPECT_EQ(sim.Run().Status(), 0);
  const auto sent = sim.Events("sent");
  ASSERT_EQ(sent.size(), 60U);
  EXPECT_EQ(sim.Events("end")[0]["lost"], 0);
  std::vector<int> line;
  for (const char byte : sim.Wire()) {
    line.push_back(static_cast<unsigned char>(byte));
  }
  const auto tokens = ReferenceTokens(line, GetParam().prefix, GetParam().suffix);
  EXPECT_GT(tokens.size(), 10U);
  for (const std::string& token : tokens) {
    EXPECT_EQ(CompactHex(TokenOf(sub.Line())), CompactHex(token));
  }
  sub.Signal(SIGTERM);
  EXPECT_EQ(sub.Output(), "");
}

INSTANTIATE_TEST_SUITE_P(
    Faults, SimWatch,
    testing::Values(
        WatchCase{"NoFault", {"scale", "--drift", "20"}, "\x02", "\x03"},
        WatchCase{"Barcode", {"barcode"}, "", "\r\n"},
        WatchCase{"RfidBytes", {"rfid", "--binary"}, "\x02", "\r\n\x03"},
        WatchCase{"DropSuffix", {"scale", "--drop-suffix", "20%"}, "\x02", "\x03"},
        WatchCase{"DropPrefix", {"scale", "--drop-prefix", "20%"}, "\x02", "\x03"},
        WatchCase{"NoiseAndFlip", {"scale", "--noise", "3%", "--flip", "2%"}, "\x02", "\x03"},
        WatchCase{"TooLong", {"barcode", "--too-long", "1200@20%"}, "", "\r\n"},
        WatchCase{
            "SplitAndPaced", {"scale", "--split", "3@2ms", "--baud", "38400"}, "\x02", "\x03"},
        WatchCase{"Burst", {"scale", "--burst", "20"}, "\x02", "\x03"},
        WatchCase{"All",
                  {"rfid", "--drop-suffix", "10", "--drop-prefix", "10", "--noise", "1", "--flip",
                   "1", "--split", "2@1ms", "--too-long", "1100@5%"},
                  "\x02",
                  "\r\n\x03"}),
    [](const testing::TestParamInfo<WatchCase>& each) { return std::string(each.param.name); });

std::vector<std::string> Words(const std::string& line) {
  std::istringstream stream(line);
  return {std::istream_iterator<std::string>(stream), {}};
}

class SimHelp : public testing::TestWithParam<const char*> {
 protected:
  // What stands behind a heading in the help of the device.
  std::string Line(const std::string& heading) {
    ProgramRun help({"sim", GetParam(), "--help"});
    const std::string text = help.Output();
    EXPECT_EQ(help.Status(), 0);
    EXPECT_LE(std::count(text.begin(), text.end(), '\n'), 40) << text;
    std::smatch found;
    EXPECT_TRUE(std::regex_search(text, found, std::regex(heading + " +loka (.*(?:\n--.*)*)")))
        << text;
    // A line that is too long for the screen goes on in the next one.
    std::string line = found[1];
    std::replace(line.begin(), line.end(), '\n', ' ');
    return line;
  }
};

TEST_P(SimHelp, HasAnExampleThatRuns) {
  const TemporaryFolder folder;
  std::string line = Line("Example:");
  line.replace(line.find("/tmp"), 4, folder.Path().string());
  ProgramRun run(Words(line));
  EXPECT_NE(run.Line().find("\"state\":\"plugged\""), std::string::npos) << line;
  EXPECT_TRUE(HasLink(folder.File(GetParam()))) << line;
  run.Signal(SIGINT);
  EXPECT_EQ(run.Status(), 128 + SIGINT);
}

TEST_P(SimHelp, TellsTheFlagsOfTheConfigurationThatTheDeviceNames) {
  ProgramRun config(Words(Line("Receive it:")));
  const std::string text = config.Line();
  EXPECT_EQ(config.Status(), 0) << config.Errors();
  ProgramRun sim({"sim", GetParam()});
  EXPECT_TRUE(sim.AwaitErrors("receive it with: " + text + "\n")) << text << sim.Errors();
}

INSTANTIATE_TEST_SUITE_P(Devices, SimHelp,
                         testing::Values("scale", "barcode", "rfid", "printer", "gauge", "modem"),
                         [](const testing::TestParamInfo<const char*>& each) {
                           return std::string(each.param);
                         });

TEST(SimProgram, HelpOfAllHasAnExampleThatRuns) {
  ProgramRun help({"sim", "--help"});
  const std::string text = help.Output();
  std::smatch found;
  ASSERT_TRUE(std::regex_search(text, found, std::regex("Example: +loka (.*)"))) << text;
  EXPECT_LE(std::count(text.begin(), text.end(), '\n'), 40) << text;
  const TemporaryFolder folder;
  std::string line = found[1];
  line.replace(line.find("/tmp"), 4, folder.Path().string());
  ProgramRun run(Words(line));
  EXPECT_EQ(run.Line().substr(0, 9), "/dev/pts/");
  run.Signal(SIGINT);
  EXPECT_EQ(run.Status(), 128 + SIGINT);
}

}  // namespace
