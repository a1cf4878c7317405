// SPDX-License-Identifier: Apache-2.0
// The manual's examples of exchanges with a device, played on a scripted line: each "exchange"
// block runs with the "config" block before it.
#include <gtest/gtest.h>

#include <regex>
#include <sstream>

#include "tests/docs/DriverInUse.h"
#include "tests/docs/MarkdownText.h"

namespace {

class Exchange {
 public:
  explicit Exchange(const std::string& configuration) {
    std::smatch match;
    EXPECT_TRUE(std::regex_search(configuration, match, std::regex(R"(\bport=(\S+))")));
    port_ = match[1];
    isRunning_ = use_.Start(configuration);
    use_.Host().Log().Take();
  }

  void Play(const std::string& block) {
    std::istringstream lines(block);
    for (std::string line; isRunning_ && std::getline(lines, line);) {
      const std::size_t end = line.find(' ');
      const std::size_t rest = line.find_first_not_of(' ', end);
      ASSERT_NE(rest, std::string::npos) << line;
      Step(line.substr(0, end), line.substr(rest));
    }
    EXPECT_EQ(use_.TokensAvailable(), 0) << block;
    EXPECT_EQ(Sent(), "") << block;
  }

 private:
  void Step(const std::string& what, const std::string& value) {
    if (what == "device") {
      use_.Receive(BytesFrom(value), port_);
    } else if (what == "token") {
      EXPECT_GT(use_.TokensAvailable(), 0);
      EXPECT_EQ(use_.TakeToken(), value);
    } else if (what == "write") {
      Write(value);
    } else if (what == "sent") {
      EXPECT_EQ(Sent(), value);
    } else {
      ADD_FAILURE() << "no such step: " << what;
    }
  }

  // "URI = value": a text, or for other types the bytes in hexadecimal.
  void Write(const std::string& assignment) {
    const std::size_t at = assignment.find(" = ");
    ASSERT_NE(at, std::string::npos) << assignment;
    const std::string uri = assignment.substr(0, at);
    const std::string value = assignment.substr(at + 3);
    const bool isText = uri.find("?string-") != std::string::npos;
    EXPECT_TRUE(use_.Write(uri, isText ? value : BytesFrom(value))) << assignment;
  }

  // What has gone out since the last time.
  std::string Sent() {
    std::istringstream log(use_.Host().Log().Take());
    std::string sent;
    for (std::string line; std::getline(log, line);) {
      if (line.compare(0, 5, "Send ") == 0) sent += line.substr(5);
    }
    return sent;
  }

  DriverInUse use_;
  std::string port_;
  bool isRunning_ = false;
};

TEST(ManualExamplesTest, EveryExchangeGoesAsWritten) {
  const MarkdownText manual("docs/manual.md");
  std::string configuration;
  int count = 0;
  for (const MarkdownText::Block& block : manual.Blocks()) {
    if (block.info == "config") configuration = block.text;
    if (block.info != "exchange") continue;
    SCOPED_TRACE(configuration + block.text);
    Exchange(configuration).Play(block.text);
    ++count;
  }
  EXPECT_GE(count, 8);
}

TEST(ManualExamplesTest, ATagHasToBeLongerThanTheToken) {
  DriverInUse use;
  ASSERT_TRUE(
      use.Start("CfgVer=1 model=1 port=com1 baudrate=9600 parity=even bits=8 stopbits=1 "
                "mode=RS-232 rx_suffix=0D"));
  use.Receive("ABCD\rE\r", "com1");
  std::string value;
  EXPECT_FALSE(use.Read("0?rx_token?string-4", value));
  EXPECT_STREQ(use.Driver().GetLastErrorString(), "token too long");
  EXPECT_TRUE(use.Read("0?rx_token?string-5", value));
  EXPECT_STREQ(value.c_str(), "ABCD");
  EXPECT_EQ(use.TakeToken(), "ABCD");
  EXPECT_EQ(use.TakeToken(), "E");
}

TEST(ManualExamplesTest, WritingTheStateOfConnectAgain) {
  for (const char* hexTokens : {"true", "false"}) {
    DriverInUse use;
    ASSERT_TRUE(
        use.Start("CfgVer=1 model=1 port=com1 baudrate=9600 parity=even bits=8 stopbits=1 "
                  "mode=RS-232 hex_tokens=" +
                  std::string(hexTokens)));
    const bool isHex = hexTokens == std::string("true");
    EXPECT_EQ(use.Write("0?connect?boolean", "\x01"), !isHex);
    if (isHex) {
      EXPECT_STREQ(use.Driver().GetLastErrorString(), "token to send must be in hex format");
    }
    EXPECT_TRUE(use.Write("0?connect?boolean", std::string(1, '\0')));
    EXPECT_FALSE(use.Write("0?connect?boolean", std::string(1, '\0')));
    EXPECT_STREQ(use.Driver().GetLastErrorString(), "Serial port not active for sending");
    EXPECT_TRUE(use.Write("0?connect?boolean", "\x01"));
    use.Driver().Stop();
    ASSERT_NE(use.Driver().Start(), 0);
  }
}

}  // namespace
