// SPDX-License-Identifier: Apache-2.0
// A day with the tool, line by line, against simulated devices: each step prints what a person who
// types it would expect there.
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <nlohmann/json.hpp>
#include <regex>

#include "tests/host/support/ProgramRun.h"
#include "tests/host/support/TextParts.h"

namespace {

using Json = nlohmann::json;
using Words = std::vector<std::string>;

struct Result {
  int status = -1;
  std::string output;
  std::string errors;
};

// One user's folders: profile, store, control sockets, devices.
class Session {
 public:
  std::unique_ptr<ProgramRun> Begin(const Words& words) const {
    return std::make_unique<ProgramRun>(words, environment_);
  }

  Result Loka(const Words& words) const {
    const auto run = Begin(words);
    Result result;
    result.output = run->Output();
    result.status = run->Status();
    result.errors = run->Errors();
    return result;
  }

  // The output of a line that ends well.
  std::string Output(const Words& words) const {
    const Result result = Loka(words);
    EXPECT_EQ(result.status, 0) << result.output << result.errors;
    return result.output;
  }

  // A simulated device, once its link is there.
  std::unique_ptr<ProgramRun> Device(const Words& words, const std::string& link) const {
    Words all = {"sim"};
    all.insert(all.end(), words.begin(), words.end());
    all.insert(all.end(), {"--link", link});
    auto device = Begin(all);
    EXPECT_NE(device->Line(), "(none)") << device->Errors();
    return device;
  }

  std::string File(const std::string& name) const { return folder_.File(name); }

 private:
  TemporaryFolder folder_;
  std::string environment_ = "LOKA_RUNTIME_DIR='" + folder_.File("control") + "' XDG_STATE_HOME='" +
                             folder_.File("state") + "' XDG_CONFIG_HOME='" +
                             folder_.File("config") + "'";
};

// The configuration of the scale, made and checked by the tool itself.
std::string ScaleConfiguration(const Session& session) {
  const std::string text =
      session.Output({"config", "new", "-b", "9600", "-d", "7", "-p", "even", "--rx-prefix", "STX",
                      "--rx-suffix", "ETX", "--tx-suffix", "CRLF"});
  std::ofstream(session.File("scale.cfg")) << text;
  return session.File("scale.cfg");
}

TEST(ExampleSession, MakesAndChecksAConfiguration) {
  const Session session;
  const Result check = session.Loka({"config", "check", ScaleConfiguration(session)});
  EXPECT_EQ(check.status, 0);
  EXPECT_EQ(check.output,
            "ok  com1 9600 7E1 RS-232  rx 02…03  tx …0D0A  gap 0 (500 ms)  queue 100\n");
}

TEST(ExampleSession, ReadsAScaleThatSendsByItself) {
  const Session session;
  const std::string scale = ScaleConfiguration(session);
  const std::string port = session.File("scale");
  const auto device = session.Device({"scale", "--every", "50"}, port);
  EXPECT_EQ(session.Output({"sub", port, "--config", scale, "-C", "3"}),
            "ST,GS+  5.12kg\nST,GS+  5.12kg\nST,GS+  5.12kg\n");
  const std::string dump = session.Output({"sub", port, "--config", scale, "-t", "-X", "-C", "1"});
  const std::regex expected(
      R"(\d\d:\d\d:\d\d\.\d{3} rx 02 53 54 2C 47 53 2B 20 20 35 2E 31 32 6B 67 )"
      R"(03   \.ST,GS\+  5\.12kg\.\n)");
  EXPECT_TRUE(std::regex_match(dump, expected)) << dump;
}

TEST(ExampleSession, AsksAScale) {
  const Session session;
  const std::string scale = ScaleConfiguration(session);
  const std::string port = session.File("scale");
  const auto device = session.Device({"scale", "--every", "0"}, port);
  EXPECT_EQ(session.Output({"ask", port, "--config", scale, "-m", "R", "-W", "10", "--fresh"}),
            "ST,GS+  5.12kg\n");
  // A command that the scale does not answer.
  const Result late = session.Loka({"ask", port, "--config", scale, "-m", "X", "-W", "0.3"});
  EXPECT_EQ(late.status, 27);
  EXPECT_EQ(late.output, "");
}

TEST(ExampleSession, ExplainsBytes) {
  const Session session;
  const std::string text = session.Output(
      {"explain", "--rx-prefix", "0202", "--rx-suffix", "03", "02", "05", "02", "02", "41", "03"});
  for (const char* const part : {"02 05", "dropped (prefix restart)", "02 02", "prefix", "41",
                                 "body", "03", "suffix", "token \"A\""}) {
    EXPECT_TRUE(Holds(text, part)) << part << " in\n" << text;
  }
}

// The owner of a port, and everybody else at its socket.
TEST(ExampleSession, ManyCommandsShareOnePort) {
  const Session session;
  const std::string scale = ScaleConfiguration(session);
  const std::string port = session.File("scale");
  const auto device = session.Device({"scale", "--every", "0"}, port);
  const auto owner = session.Begin({"run", port, "--config", scale, "--ack", "never"});
  ASSERT_TRUE(owner->AwaitErrors("commands attach at")) << owner->Errors();
  (void)session.Output({"ask", "-m", "R", "-W", "10"});

  const std::string tags = session.Output({"tags"});
  for (const char* const row : {"0?tokens_available?unsignedInt   read         1\n",
                                "0?rx_token_len?unsignedInt       read         14\n",
                                "0?connect?boolean                read, write  1\n",
                                "0?SP_Baud?unsignedInt            read, write  9600\n"}) {
    EXPECT_TRUE(Holds(tags, row)) << row << " in\n" << tags;
  }
  EXPECT_EQ(session.Output({"read", "0?tokens_available?unsignedInt"}), "1\n");
  const Result tooShort = session.Loka({"read", "0?rx_token?string-8"});
  EXPECT_EQ(tooShort.status, 1);
  EXPECT_TRUE(Holds(tooShort.errors,
                    "error -1: token too long   hint: 14 bytes waiting, use "
                    "string-15 or longer"))
      << tooShort.errors;
  EXPECT_EQ(session.Output({"set", "rx_suffix=0D0A", "baud=19200", "--stage"}),
            "staged: baud 19200 (active 9600), rx_suffix 0D0A (active 03)\n");
  EXPECT_EQ(session.Output({"write", "0?SP_Done?boolean", "1"}),
            "applied and stored; 1 waiting token cleared\n");
  const std::string stored = session.Output({"store", "ls"});
  EXPECT_TRUE(std::regex_search(stored, std::regex(R"(baud\s+19200)"))) << stored;
  EXPECT_TRUE(std::regex_search(stored, std::regex(R"(rx_suffix\s+0D0A)"))) << stored;
  const Result removed = session.Loka({"store", "rm", "--all"});
  EXPECT_EQ(removed.status, 0);
  EXPECT_TRUE(Holds(removed.output + removed.errors,
                    "2 removed; the running driver keeps its cached values until it is restarted"))
      << removed.output << removed.errors;
  EXPECT_EQ(session.Output({"cmd", "get_stat"}), "Connected\n");
  const std::string stats = session.Output({"stats"});
  EXPECT_TRUE(
      std::regex_search(stats, std::regex(R"(tokens 1  dropped \d+.*lost sends 0  reconnects 0)")))
      << stats;
}

TEST(ExampleSession, ScannerWithFaultsAsLinesOfJson) {
  const Session session;
  const std::string link = session.File("scanner");
  const auto device =
      session.Device({"barcode", "--every", "20", "--drop-suffix", "20%", "--seed", "3"}, link);
  const std::string text = session.Output(
      {"sub", "com1=pty:" + link, "--rx-suffix", "CRLF", "--gap", "5000", "-j", "-C", "20"});
  int tokens = 0;
  std::uint64_t number = 0;
  for (std::size_t at = 0; at < text.size(); at = text.find('\n', at) + 1) {
    const Json line = Json::parse(text.substr(at, text.find('\n', at) - at));
    if (line["ev"] == "token") {
      ++tokens;
      EXPECT_EQ(line["n"].get<std::uint64_t>(), ++number);
    }
  }
  EXPECT_EQ(tokens, 20);
}

TEST(ExampleSession, AProfileIsOneWord) {
  const Session session;
  const std::string port = session.File("scale");
  const auto device = session.Device({"scale", "--every", "50"}, port);
  std::filesystem::create_directories(session.File("config/loka"));
  std::ofstream(session.File("config/loka/config.toml"))
      << "[scale]\nport=\"" << port << "\"\nbaudrate=9600\nrx_prefix=\"02\"\nrx_suffix=\"03\"\n";
  EXPECT_EQ(session.Output({"sub", "scale", "-C", "1"}), "ST,GS+  5.12kg\n");
}

TEST(ExampleSession, TheDriverDescribesItself) {
  const Session session;
  EXPECT_TRUE(Holds(session.Output({"describe", "--html"}), "<form"));
  EXPECT_EQ(Json::parse(session.Output({"describe", "--schema"})).value("type", ""), "object");
}

}  // namespace
