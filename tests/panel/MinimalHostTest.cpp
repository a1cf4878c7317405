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
#include <string>

#include "tests/support/PluginLibrary.h"

namespace {

constexpr int kLimitMs = 20000;
constexpr const char* kConfiguration =
    "CfgVer=1 model=1 port=com1 baudrate=9600 parity=none bits=8 stopbits=1 mode=RS-232 "
    "rx_prefix=02 rx_suffix=03";

class MinimalHostTest : public ::testing::Test {
 protected:
  void SetUp() override {
    device_ = posix_openpt(O_RDWR | O_NOCTTY);
    ASSERT_GE(device_, 0);
    ASSERT_EQ(grantpt(device_), 0);
    ASSERT_EQ(unlockpt(device_), 0);
    // Held open, so that the device's end never hangs up.
    line_ = open(ptsname(device_), O_RDWR | O_NOCTTY);
    ASSERT_GE(line_, 0);
  }
  void TearDown() override {
    if (program_ > 0) {
      kill(program_, SIGKILL);
      waitpid(program_, nullptr, 0);
    }
    for (const int file : {output_, line_, device_}) close(file);
  }

  void Start(const std::string& library, const std::string& configuration) {
    int pipe[2];
    ASSERT_EQ(pipe2(pipe, O_CLOEXEC), 0);
    output_ = pipe[0];
    program_ = fork();
    if (program_ == 0) {
      dup2(pipe[1], STDOUT_FILENO);
      dup2(pipe[1], STDERR_FILENO);
      execl(LOKA_MINIMAL_HOST, LOKA_MINIMAL_HOST, library.c_str(), ptsname(device_), "3",
            configuration.c_str(), nullptr);
      _exit(127);
    }
    close(pipe[1]);
  }

  // What the program writes until its line with this text, or its end.
  std::string OutputUntil(const std::string& text) {
    std::string output;
    char byte = 0;
    pollfd wait = {output_, POLLIN, 0};
    while (output.find(text + "\n") == std::string::npos && poll(&wait, 1, kLimitMs) == 1 &&
           read(output_, &byte, 1) == 1) {
      output += byte;
    }
    return output;
  }

  int Status() {
    int status = 0;
    EXPECT_EQ(waitpid(program_, &status, 0), program_);
    program_ = -1;
    return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
  }

  int device_ = -1;
  int line_ = -1;
  int output_ = -1;
  pid_t program_ = -1;
};

TEST_F(MinimalHostTest, PrintsThreeTokens) {
  Start(PluginLibrary::DefaultPath(), kConfiguration);
  ASSERT_EQ(OutputUntil("started"), "started\n");
  const std::string bytes =
      "\x02"
      "AB\x03noise\x02"
      "CD\x03\x02"
      "EF\x03";
  ASSERT_EQ(write(device_, bytes.data(), bytes.size()), static_cast<ssize_t>(bytes.size()));
  EXPECT_EQ(OutputUntil("EF"), "AB\nCD\nEF\n");
  EXPECT_EQ(Status(), 0);
}

TEST_F(MinimalHostTest, SaysWhyAConfigurationIsRefused) {
  Start(PluginLibrary::DefaultPath(), "CfgVer=2");
  EXPECT_EQ(OutputUntil("unknown format"), "Parser: unknown format\n");
  EXPECT_EQ(Status(), 4);
}

TEST_F(MinimalHostTest, SaysWhyALibraryIsRefused) {
  Start("/nonexistent.so", kConfiguration);
  EXPECT_NE(OutputUntil("directory").find("/nonexistent.so"), std::string::npos);
  EXPECT_EQ(Status(), 3);
}

TEST(MinimalHostSourceTest, HasLessThan150Lines) {
  std::ifstream file(std::string(LOKA_SOURCE_DIR) + "/examples/minimal_host/MinimalHost.cpp");
  int count = 0;
  for (std::string line; std::getline(file, line);) ++count;
  EXPECT_GT(count, 0);
  EXPECT_LT(count, 150);
}

}  // namespace
