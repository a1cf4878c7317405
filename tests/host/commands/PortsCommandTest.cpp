// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <fstream>
#include <nlohmann/json.hpp>

#include "host/commands/CommandLine.h"
#include "host/port/PortList.h"
#include "host/port/PortOptions.h"
#include "host/port/PortReport.h"
#include "host/port/PseudoTerminal.h"
#include "tests/host/port/LockingProcess.h"
#include "tests/host/support/TemporaryFolder.h"

namespace fs = std::filesystem;

namespace {

// A made-up machine: a USB adapter whose device is really a pseudo-terminal, and a built-in port
// whose device is missing.
class PortsCommandTest : public testing::Test {
 protected:
  PortsCommandTest() {
    const fs::path usb = folder_.Path() / "devices/usb1/1-1";
    fs::create_directories(usb / "1-1:1.0/ttyUSB0/tty/ttyUSB0");
    Write(usb / "manufacturer", "Maker & Sons");
    Write(usb / "product", "Adapter \x1B[31m");
    Write(usb / "serial", "SN1");
    Write(usb / "1-1:1.0/ttyUSB0/latency_timer", "16");
    fs::create_directories(Class() / "ttyUSB0");
    fs::create_directories(Class() / "ttyS0/device");
    fs::create_symlink(usb / "1-1:1.0/ttyUSB0", Class() / "ttyUSB0/device");
    fs::create_symlink("../../drivers/ftdi_sio", usb / "1-1:1.0/ttyUSB0/driver");
    Write(Class() / "ttyS0/type", "4");
    fs::create_directories(Root() / "serial/by-id");
    fs::create_symlink(line_.Path(), Root() / "ttyUSB0");
    fs::create_symlink("../../ttyUSB0", Root() / "serial/by-id/usb-Maker");
  }

  static void Write(const fs::path& file, const std::string& text) {
    std::ofstream(file) << text << "\n";
  }
  fs::path Class() const { return folder_.Path() / "class"; }
  fs::path Root() const { return folder_.Path() / "dev"; }
  std::vector<ListedPort> List() const {
    std::vector<ListedPort> ports = ListPorts(Class().string(), Root().string());
    return ports;
  }

  TemporaryFolder folder_;
  PseudoTerminal line_;
};

TEST_F(PortsCommandTest, TellsWhatTheSystemKnows) {
  const auto ports = List();
  ASSERT_EQ(ports.size(), 2U);
  EXPECT_EQ(ports[0].manufacturer, "Maker & Sons");
  EXPECT_EQ(ports[0].product, "Adapter \x1B[31m");
  EXPECT_EQ(ports[0].serialNumber, "SN1");
  EXPECT_EQ(ports[0].driver, "ftdi_sio");
  EXPECT_EQ(ports[0].latencyMs, 16);
  EXPECT_EQ(ports[1].path, (Root() / "ttyS0").string());
  EXPECT_EQ(ports[1].product, "");
  EXPECT_EQ(ports[1].latencyMs, -1);
}

TEST_F(PortsCommandTest, OneLineAPortByIdFirst) {
  const std::string stable = (Root() / "serial/by-id/usb-Maker").string();
  const std::string plain = (Root() / "ttyS0").string();
  const auto lines = DescribePorts(List(), false);
  ASSERT_EQ(lines.size(), 2U);
  EXPECT_EQ(lines[0], stable + "  ftdi_sio  free");
  EXPECT_EQ(lines[1].rfind(plain, 0), 0U);
}

TEST_F(PortsCommandTest, LongListEndsWithTheWordToCopyAndEscapesNames) {
  const std::string stable = (Root() / "serial/by-id/usb-Maker").string();
  auto ports = List();
  ports.resize(1);
  const auto lines = DescribePorts(ports, true);
  const std::vector<std::string> expected = {stable,
                                             "  device    " + (Root() / "ttyUSB0").string(),
                                             "  maker     Maker & Sons",
                                             "  product   Adapter \\x1b[31m",
                                             "  serial    SN1",
                                             "  driver    ftdi_sio",
                                             "  latency   16 ms",
                                             "  state     free",
                                             "  use       --port com1=" + stable};
  EXPECT_EQ(lines, expected);
}

TEST_F(PortsCommandTest, NamesTheHolderAndMissingRights) {
  const LockingProcess other(line_.Path());
  auto ports = List();
  FindStates(&ports);
  EXPECT_EQ(ports[0].state, ListedPort::State::kBusy);
  ASSERT_EQ(ports[0].holders.size(), 1U);
  EXPECT_EQ(ports[0].holders[0].processId, other.ProcessId());
  EXPECT_EQ(ports[1].state, ListedPort::State::kNoRights);
  const auto lines = DescribePorts(ports, false);
  EXPECT_NE(lines[0].find("in use by process " + std::to_string(other.ProcessId()) + " ("),
            std::string::npos);
}

TEST_F(PortsCommandTest, JsonHasTheSame) {
  const LockingProcess other(line_.Path());
  auto ports = List();
  FindStates(&ports);
  const auto lines = PortsAsJson(ports);
  ASSERT_EQ(lines.size(), 2U);
  const auto usb = nlohmann::json::parse(lines[0]);
  EXPECT_EQ(usb["product"], "Adapter \x1B[31m");
  EXPECT_EQ(usb["latency_ms"], 16);
  EXPECT_EQ(usb["state"], "busy");
  EXPECT_EQ(usb["holders"][0]["pid"], other.ProcessId());
  EXPECT_EQ(usb["word"], "com1=" + usb["path"].get<std::string>());
  const auto plain = nlohmann::json::parse(lines[1]);
  EXPECT_FALSE(plain.contains("product"));
  EXPECT_FALSE(plain.contains("holders"));
}

TEST_F(PortsCommandTest, ExampleOfTheHelpTextWorks) {
  const std::string classFolder = Class().string();
  const std::string deviceRoot = Root().string();
  const std::vector<const char*> words = {
      "loka",          "ports",           "-l", "--class-folder", classFolder.c_str(),
      "--device-root", deviceRoot.c_str()};
  testing::internal::CaptureStdout();
  const int status = RunCommandLine(static_cast<int>(words.size()), words.data());
  const std::string output = testing::internal::GetCapturedStdout();
  EXPECT_EQ(status, 0);
  EXPECT_NE(output.find("  use       --port com1=" + deviceRoot + "/serial/by-id/usb-Maker\n"),
            std::string::npos)
      << output;
}

TEST_F(PortsCommandTest, HelpNamesEachPortOption) {
  const std::vector<const char*> words = {"loka", "ports", "--help"};
  testing::internal::CaptureStdout();
  EXPECT_EQ(RunCommandLine(static_cast<int>(words.size()), words.data()), 0);
  const std::string output = testing::internal::GetCapturedStdout();
  EXPECT_NE(output.find("Example: loka ports -l\n"), std::string::npos);
  for (const std::string& line : DescribePortOptions()) {
    EXPECT_NE(output.find(line), std::string::npos) << line;
  }
}

TEST(PortsAsJson, SurvivesNamesThatAreNoText) {
  ListedPort port;
  port.path = "/dev/x";
  port.product = "\xFF\x01";
  const auto object = nlohmann::json::parse(PortsAsJson({port})[0]);
  EXPECT_EQ(object["product"], "\xEF\xBF\xBD\x01");
}

}  // namespace
