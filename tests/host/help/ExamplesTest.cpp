// SPDX-License-Identifier: Apache-2.0
// Every example of --help, run as it stands: the port is a pseudo-terminal on which a device
// speaks, files are in a folder of the test.
#include <gtest/gtest.h>

#include <CLI/CLI.hpp>
#include <atomic>
#include <csignal>
#include <filesystem>
#include <fstream>
#include <regex>
#include <sstream>
#include <thread>

#include "host/base/ChildProcess.h"
#include "host/base/Deadline.h"
#include "host/commands/CommandTree.h"
#include "host/completion/CommandModel.h"
#include "host/port/PseudoTerminal.h"
#include "tests/host/support/PluginConfiguration.h"
#include "tests/host/support/TemporaryFolder.h"
#include "tests/support/PluginLibrary.h"

namespace {

constexpr int kExampleLimitMs = 30000;
constexpr int kTerminated = 128 + SIGTERM;

// What is there before the example runs.
enum class Scene { kNothing, kDevice, kRunning, kStored };

struct Expectation {
  const char* path;  // of the command, "/config/new"
  Scene scene;
  int status;          // kTerminated: it stays, and is ended once its output has come
  const char* output;  // a regular expression for a line of standard output or standard error
};

const Expectation kExpectations[] = {
    {"/sub", Scene::kDevice, 0, "12\\.5"},
    {"/send", Scene::kDevice, 0, ""},
    {"/ask", Scene::kDevice, 0, ".*12\\.5.*"},
    {"/term", Scene::kDevice, 0, ".*12\\.5.*"},
    {"/cmd", Scene::kDevice, 0, ".*"},
    {"/ports", Scene::kNothing, 0, ".*"},
    {"/tags", Scene::kRunning, 0, ".*\"name\":\"rx_token\".*"},
    {"/read", Scene::kRunning, 0, "[0-9]+"},
    {"/write", Scene::kRunning, 0, ""},
    {"/set", Scene::kRunning, 0, ".*baud 19200.*"},
    {"/store", Scene::kStored, 0, "baud 19200  rx_suffix 0D0A.*"},
    {"/store/ls", Scene::kStored, 0, "baud 19200  rx_suffix 0D0A.*"},
    {"/store/get", Scene::kStored, 0, "19200"},
    {"/store/set", Scene::kNothing, 0, "2 stored: 2 new.*"},
    {"/store/rm", Scene::kStored, 0, "2 removed.*"},
    {"/store/export", Scene::kStored, 0, ""},
    {"/store/import", Scene::kStored, 0, "2 stored: 0 new, 2 as before.*"},
    {"/connect", Scene::kRunning, 0, "connected"},
    {"/explain", Scene::kNothing, 0, ".*token.*\"A\".*"},
    {"/describe", Scene::kNothing, 0, " +\"fullName\": .*"},
    {"/config", Scene::kNothing, 0, "CfgVer=1 .*baudrate=9600 parity=even bits=7.*"},
    {"/config/new", Scene::kNothing, 0, "CfgVer=1 .*baudrate=9600 parity=even bits=7.*"},
    {"/config/check", Scene::kNothing, 0, "ok  com1 9600 8E1.*"},
    {"/config/show", Scene::kNothing, 0, "rx_suffix.*0D.*"},
    {"/config/profiles", Scene::kNothing, 0, "loka: no profiles; they stand in .*"},
    {"/stats", Scene::kRunning, 0, "\\{.*\"tokens\":.*\\}"},
    {"/sim", Scene::kNothing, kTerminated, "/dev/pts/[0-9]+"},
    {"/sim/scale", Scene::kNothing, kTerminated, ".*/dev/pts/[0-9]+.*"},
    {"/sim/barcode", Scene::kNothing, kTerminated, ".*/dev/pts/[0-9]+.*"},
    {"/sim/rfid", Scene::kNothing, kTerminated, ".*/dev/pts/[0-9]+.*"},
    {"/sim/printer", Scene::kNothing, kTerminated, ".*/dev/pts/[0-9]+.*"},
    {"/sim/gauge", Scene::kNothing, kTerminated, ".*/dev/pts/[0-9]+.*"},
    {"/sim/modem", Scene::kNothing, kTerminated, ".*/dev/pts/[0-9]+.*"},
    {"/run", Scene::kDevice, kTerminated, "loka: ready; commands attach at .*"},
    {"/demo", Scene::kNothing, 0, "demo: 11 of 11 steps as expected"},
    {"/completion", Scene::kNothing, 0, "complete -F _loka loka"},
};

void PrintTo(const Expectation& expectation, std::ostream* stream) { *stream << expectation.path; }

std::string Replaced(std::string text, const std::string& from, const std::string& to) {
  for (std::size_t at = text.find(from); at != std::string::npos;
       at = text.find(from, at + to.size())) {
    text.replace(at, from.size(), to);
  }
  return text;
}

// The first example of a command; empty for none.
std::string ExampleOf(const std::string& path) {
  const CommandTree tree;
  const CommandModel root = ModelOf(tree.App());
  for (const PlacedCommand& placed : AllCommands(root)) {
    std::smatch match;
    const std::regex example("(?:^|\n)Example: +([^\n]*)");
    if (placed.path == path && std::regex_search(placed.command->footer, match, example)) {
      return match[1];
    }
  }
  return "";
}

class ExamplesTest : public ::testing::TestWithParam<Expectation> {
 protected:
  ~ExamplesTest() override {
    isOver_ = true;
    if (device_.joinable()) {
      device_.join();
    }
    if (owner_ != nullptr) {
      owner_->Signal(SIGTERM);
    }
  }

  void SetUp() override {
    std::ofstream(folder_.File("scale.cfg")) << TestConfiguration("rx_suffix=03");
    std::ofstream(folder_.File("settings.json"))
        << R"({"com1": {"baud": 19200, "rx_suffix": "0D0A"}})";
    std::filesystem::create_directory(folder_.File("bin"));
    std::filesystem::create_symlink(LOKA_PROGRAM_PATH, folder_.File("bin/loka"));
    std::filesystem::create_symlink(PluginLibrary::DefaultPath(), folder_.File("libLOKA.so"));
    if (GetParam().scene == Scene::kStored) {
      ChildProcess store("/bin/sh", Shell("loka store set baud=19200 rx_suffix=CRLF >store.log"));
      ASSERT_EQ(store.Wait(Deadline::After(kExampleLimitMs)), 0);
      ChildProcess exported("/bin/sh", Shell("loka store export >settings.json"));
      ASSERT_EQ(exported.Wait(Deadline::After(kExampleLimitMs)), 0);
    }
    if (GetParam().scene == Scene::kRunning) {
      owner_ = std::make_unique<ChildProcess>(
          "/bin/sh", Shell("exec loka run scale.cfg.port --config scale.cfg --ack never 2>&1"));
      std::string line;
      while (line.find("commands attach at") == std::string::npos) {
        ASSERT_TRUE(owner_->ReadLine(Deadline::After(kExampleLimitMs), &line));
      }
    }
    if (GetParam().scene == Scene::kDevice) {
      device_ = std::thread([this] {
        while (!isOver_) {
          (void)line_.Send(
              "\x02"
              "12.5\x03\r\n",
              Deadline::After(20));
          Deadline::After(20).Sleep();
        }
      });
    }
  }

  // The words for a shell that runs a line in the folder of the test, with its store, its control
  // sockets and its port.
  std::vector<std::string> Shell(std::string line) const {
    line = Replaced(line, "/dev/ttyUSB0", line_.Path());
    line = Replaced(line, "scale.cfg.port", line_.Path());
    line = Replaced(line, "--link /tmp/", "--link " + folder_.Path().string() + "/link-");
    const std::string folder = folder_.Path().string();
    return {"sh", "-c",
            "cd '" + folder + "'; unset LOKA_PORT; export PATH='" + folder +
                "/bin':\"$PATH\" LOKA_PLUGIN='" + folder + "/libLOKA.so' XDG_STATE_HOME='" +
                folder + "' XDG_CONFIG_HOME='" + folder + "' LOKA_RUNTIME_DIR='" + folder +
                "/control'; " + line};
  }

  const TemporaryFolder folder_;
  PseudoTerminal line_;
  std::unique_ptr<ChildProcess> owner_;
  std::atomic<bool> isOver_{false};
  std::thread device_;
};

TEST_P(ExamplesTest, DoesWhatItShows) {
  const Expectation& expected = GetParam();
  const std::string example = ExampleOf(expected.path);
  ASSERT_EQ(example.rfind("loka ", 0), 0U) << expected.path << ": " << example;
  const bool isStaying = expected.status == kTerminated;
  const std::string line = (isStaying ? "exec " : "") + example + " 2>&1";
  ChildProcess process("/bin/sh", Shell(line));
  const std::regex wanted(expected.output);
  const bool isTerm = std::string(expected.path) == "/term";
  bool isFound = std::string(expected.output).empty();
  std::string output;
  std::string text;
  const Deadline deadline = Deadline::After(kExampleLimitMs);
  while (process.ReadLine(deadline, &text)) {
    output += text + "\n";
    isFound = isFound || std::regex_match(text, wanted);
    if (isFound && (isStaying || isTerm)) {
      break;
    }
  }
  EXPECT_TRUE(isFound) << example << "\n" << output;
  if (isStaying) {
    process.Signal(SIGTERM);
  }
  EXPECT_EQ(process.Wait(deadline), expected.status) << example << "\n" << output;
}

std::string NameOfExample(const ::testing::TestParamInfo<Expectation>& entry) {
  return Replaced(std::string(entry.param.path).substr(1), "/", "_");
}

INSTANTIATE_TEST_SUITE_P(Help, ExamplesTest, ::testing::ValuesIn(kExpectations), NameOfExample);

TEST(Examples, NoneIsLeftOut) {
  const CommandTree tree;
  const CommandModel root = ModelOf(tree.App());
  for (const PlacedCommand& placed : AllCommands(root)) {
    const bool isListed =
        std::any_of(std::begin(kExpectations), std::end(kExpectations),
                    [&](const Expectation& entry) { return placed.path == entry.path; });
    EXPECT_TRUE(isListed || placed.path.empty()) << placed.path;
  }
}

}  // namespace
