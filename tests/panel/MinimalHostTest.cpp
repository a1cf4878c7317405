// SPDX-License-Identifier: Apache-2.0
// The minimal host of the documentation: short enough to be read, and it works.
#include <fcntl.h>
#include <gtest/gtest.h>
#include <poll.h>
#include <signal.h>
#include <stdlib.h>
#include <sys/wait.h>
#include <termios.h>
#include <unistd.h>

#include <fstream>
#include <stdexcept>
#include <string>

#include "tests/panel/HostChecks.h"
#include "tests/panel/HostSession.h"
#include "tests/support/PluginLibrary.h"

namespace {

constexpr int kLimitMs = 20000;
constexpr const char* kConfiguration =
    "CfgVer=1 model=1 port=com1 baudrate=9600 parity=none bits=8 stopbits=1 mode=RS-232 "
    "rx_prefix=02 rx_suffix=03";

// The minimal host as a process, its port a pseudo-terminal.
class TerminalSession final : public HostSession {
 public:
  explicit TerminalSession(std::string library) : library_(std::move(library)) {
    device_ = posix_openpt(O_RDWR | O_NOCTTY | O_CLOEXEC);
    if (device_ < 0 || grantpt(device_) != 0 || unlockpt(device_) != 0) {
      throw std::runtime_error("no pseudo-terminal");
    }
    // Held open, so that the device's end never hangs up.
    line_ = open(ptsname(device_), O_RDWR | O_NOCTTY | O_CLOEXEC);
  }
  ~TerminalSession() override {
    if (program_ > 0) {
      kill(program_, SIGKILL);
      waitpid(program_, nullptr, 0);
    }
    for (const int file : {input_, output_, line_, device_}) close(file);
  }

  std::string Start(const std::string& configuration) override {
    return StartForTokens(configuration, 0);
  }
  std::string StartForTokens(const std::string& configuration, int tokens) {
    int toHost[2];
    int fromHost[2];
    if (pipe2(toHost, O_CLOEXEC) != 0 || pipe2(fromHost, O_CLOEXEC) != 0) return "no pipe";
    program_ = fork();
    if (program_ == 0) {
      dup2(toHost[0], STDIN_FILENO);
      dup2(fromHost[1], STDOUT_FILENO);
      dup2(fromHost[1], STDERR_FILENO);
      execl(LOKA_MINIMAL_HOST, LOKA_MINIMAL_HOST, library_.c_str(), ptsname(device_),
            std::to_string(tokens).c_str(), configuration.c_str(), nullptr);
      _exit(127);
    }
    close(toHost[0]);
    close(fromHost[1]);
    input_ = toHost[1];
    output_ = fromHost[0];
    return OutputLine();
  }

  int End() override {
    close(input_);
    input_ = -1;
    int status = 0;
    EXPECT_EQ(waitpid(program_, &status, 0), program_);
    program_ = -1;
    return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
  }

  std::string Ask(const std::string& command) override {
    const std::string line = command + "\n";
    EXPECT_EQ(write(input_, line.data(), line.size()), static_cast<ssize_t>(line.size()));
    std::string output;
    for (;;) {
      const std::string next = OutputLine();
      output += next;
      if (next == "true" || next == "false" || !isSpeaking_) return output;
      output += '\n';
    }
  }

  // Without its end; what there is when none comes.
  std::string OutputLine() {
    std::string output;
    char byte = 0;
    while ((isSpeaking_ = ReadByte(output_, byte)) && byte != '\n') output += byte;
    return output;
  }

  void SendOnLine(const std::string& bytes) override {
    EXPECT_EQ(write(device_, bytes.data(), bytes.size()), static_cast<ssize_t>(bytes.size()));
  }
  std::string TakeFromLine(std::size_t count) override {
    std::string taken;
    char byte = 0;
    while (taken.size() < count && ReadByte(device_, byte)) taken += byte;
    return taken;
  }
  // A pseudo-terminal takes every setting and keeps few.
  std::string LineSettings() override { return ""; }

 private:
  static bool ReadByte(int file, char& byte) {
    pollfd wait = {file, POLLIN, 0};
    return poll(&wait, 1, kLimitMs) == 1 && read(file, &byte, 1) == 1;
  }

  const std::string library_;
  int device_ = -1;
  int line_ = -1;
  int input_ = -1;
  int output_ = -1;
  pid_t program_ = -1;
  bool isSpeaking_ = true;  // the last byte that was asked for came
};

TEST(MinimalHostTest, PrintsThreeTokens) {
  TerminalSession host(PluginLibrary::DefaultPath());
  ASSERT_EQ(host.StartForTokens(kConfiguration, 3), "started");
  host.SendOnLine(
      "\x02"
      "AB\x03noise\x02"
      "CD\x03\x02"
      "EF\x03");
  for (const char* token : {"AB", "CD", "EF"}) EXPECT_EQ(host.OutputLine(), token);
  EXPECT_EQ(host.End(), 0);
}

TEST(MinimalHostTest, SaysWhyAConfigurationIsRefused) {
  TerminalSession host(PluginLibrary::DefaultPath());
  EXPECT_EQ(host.Start("CfgVer=2"), "Parser: unknown format");
  EXPECT_EQ(host.End(), 4);
}

TEST(MinimalHostTest, SaysWhyALibraryIsRefused) {
  TerminalSession host("/nonexistent.so");
  EXPECT_NE(host.Start(kConfiguration).find("/nonexistent.so"), std::string::npos);
  EXPECT_EQ(host.End(), 3);
}

class MinimalHostCheckTest : public ::testing::TestWithParam<HostCheck> {};

TEST_P(MinimalHostCheckTest, AllSteps) {
  TerminalSession host(PluginLibrary::DefaultPath());
  EXPECT_EQ(Problems(GetParam(), host), "");
}

INSTANTIATE_TEST_SUITE_P(Checks, MinimalHostCheckTest, ::testing::ValuesIn(HostChecks()),
                         [](const auto& test) { return test.param.name; });

TEST(MinimalHostSourceTest, HasLessThan150Lines) {
  std::ifstream file(std::string(LOKA_SOURCE_DIR) + "/examples/minimal_host/MinimalHost.cpp");
  int count = 0;
  for (std::string line; std::getline(file, line);) ++count;
  EXPECT_GT(count, 0);
  EXPECT_LT(count, 150);
}

}  // namespace
