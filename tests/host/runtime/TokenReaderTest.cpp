// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <memory>

#include "host/port/PseudoTerminal.h"
#include "host/runtime/HostSession.h"
#include "host/runtime/TokenReader.h"
#include "tests/host/port/CountingObserver.h"
#include "tests/host/support/PluginConfiguration.h"
#include "tests/host/support/TestLimit.h"
#include "tests/support/PluginLibrary.h"

namespace {

using Outcome = TokenReader::Outcome;

class TokenReaderTest : public testing::Test {
 protected:
  void Start(const std::string& configuration) {
    HostOptions options;
    options.pluginFile = PluginLibrary::DefaultPath();
    options.observer = &observer_;
    std::string error;
    ASSERT_TRUE(options.ports.Add(line_.Path(), &error));
    session_ = std::make_unique<HostSession>(options);
    ASSERT_TRUE(session_->Open().IsDone());
    ASSERT_TRUE(session_->Configure(TestConfiguration("gap=20 " + configuration)).IsDone());
    ASSERT_TRUE(session_->Start().IsDone());
    reader_ = std::make_unique<TokenReader>(session_.get());
  }
  // Sends and waits until the driver has worked everything off.
  void DeviceSends(const std::string& bytes) {
    sentBytes_ += bytes.size();
    ASSERT_TRUE(line_.Send(bytes, Deadline::After(kLimitMs)));
    ASSERT_TRUE(observer_.AwaitBytes(sentBytes_, kLimitMs));
  }
  void TearDown() override {
    reader_.reset();
    session_.reset();
  }

  PseudoTerminal line_;
  CountingObserver observer_;
  std::unique_ptr<HostSession> session_;
  std::unique_ptr<TokenReader> reader_;
  std::uint64_t sentBytes_ = 0;
};

TEST_F(TokenReaderTest, TakesTokensInOrder) {
  Start("rx_suffix=03");
  ReceivedToken token;
  EXPECT_EQ(reader_->Take(&token), Outcome::kEmpty);
  DeviceSends("one\x03two\x03");
  unsigned int waiting = 0;
  EXPECT_TRUE(reader_->CountWaiting(&waiting));
  EXPECT_EQ(waiting, 2U);
  ASSERT_EQ(reader_->Take(&token), Outcome::kToken);
  EXPECT_EQ(token.bytes, "one");
  EXPECT_EQ(token.lengthBytes, 3U);
  EXPECT_FALSE(token.isCut);
  ASSERT_EQ(reader_->Peek(&token), Outcome::kToken);
  ASSERT_EQ(reader_->Take(&token), Outcome::kToken);
  EXPECT_EQ(token.bytes, "two");
  EXPECT_EQ(reader_->Take(&token), Outcome::kEmpty);
}

TEST_F(TokenReaderTest, TakesTokensOfEveryLength) {
  Start("rx_prefix=02 rx_suffix=03");
  // Around the room of the first tag, of the next ones, and the longest token there is.
  for (const std::size_t length : {0U, 1U, 254U, 255U, 256U, 257U, 511U, 512U, 998U}) {
    const std::string body(length, 'x');
    DeviceSends("\x02" + body + "\x03");
    ReceivedToken token;
    ASSERT_EQ(reader_->Take(&token), Outcome::kToken) << length << " " << reader_->Error();
    EXPECT_EQ(token.bytes, body);
    EXPECT_EQ(token.lengthBytes, length);
  }
}

TEST_F(TokenReaderTest, DecodesHexTokens) {
  Start("rx_prefix=02 rx_suffix=03 hex_tokens=true");
  const std::string body = std::string("\0\xFF\x1B", 3) + std::string(900, '\x41');
  DeviceSends("\x02" + body + "\x03");
  ReceivedToken token;
  ASSERT_EQ(reader_->Take(&token), Outcome::kToken) << reader_->Error();
  EXPECT_EQ(token.bytes, body);
  EXPECT_EQ(token.lengthBytes, body.size());
  EXPECT_FALSE(token.isCut);
}

TEST_F(TokenReaderTest, TellsTheTrueLengthOfATokenWithAZeroByte) {
  Start("rx_suffix=03");
  DeviceSends(std::string("ab\0cd\x03", 6));
  ReceivedToken token;
  ASSERT_EQ(reader_->Take(&token), Outcome::kToken);
  EXPECT_EQ(token.bytes, "ab");
  EXPECT_EQ(token.lengthBytes, 5U);
  EXPECT_TRUE(token.isCut);
}

TEST_F(TokenReaderTest, TellsTheDriversWords) {
  Start("rx_suffix=03");
  session_->Stop();
  ReceivedToken token;
  EXPECT_EQ(reader_->Take(&token), Outcome::kFailed);
  EXPECT_EQ(reader_->Error(), "Protocol not started");
}

}  // namespace
