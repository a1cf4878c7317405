// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <fstream>
#include <iterator>

#include "host/events/WallClock.h"
#include "host/log/LogFile.h"
#include "tests/host/support/TemporaryFolder.h"

namespace {

std::string Content(const std::string& path) {
  std::ifstream file(path);
  return {std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>()};
}

HostEvent Token(const std::string& bytes) {
  TokenReceived token;
  token.number = 7;
  token.bytes = bytes;
  token.lengthBytes = static_cast<unsigned int>(bytes.size());
  std::int64_t timeUs = 0;
  EXPECT_TRUE(ParseUtcText("2026-11-21T09:12:03.123456Z", &timeUs));
  return {timeUs, "com2", token};
}

class LogFileTest : public testing::Test {
 protected:
  std::unique_ptr<LogFile> Open(const std::string& path) {
    return LogFile::Open(
        path, [this](const std::string& text) { problems_.push_back(text); }, &error_);
  }

  const TemporaryFolder folder_;
  std::vector<std::string> problems_;
  std::string error_;
};

TEST_F(LogFileTest, WritesALineAnEventWithItsTimeAtOnce) {
  const auto log = Open(folder_.File("log"));
  ASSERT_NE(log, nullptr) << error_;
  log->OnEvent(Token("A\x1B{}%v"));
  EXPECT_EQ(Content(folder_.File("log")),
            "2026-11-21T09:12:03.123456Z com2 token 7  \"A\\x1b{}%v\"  6 bytes\n");
  EXPECT_TRUE(problems_.empty());
}

TEST_F(LogFileTest, AppendsToWhatIsThere) {
  for (int i = 0; i < 2; ++i) {
    const auto log = Open(folder_.File("log"));
    ASSERT_NE(log, nullptr) << error_;
    log->OnEvent({0, "com1", NoteMade{"note"}});
  }
  EXPECT_EQ(Content(folder_.File("log")),
            "1970-01-01T00:00:00.000000Z com1 note\n1970-01-01T00:00:00.000000Z com1 note\n");
}

TEST_F(LogFileTest, APlaceThatIsNoneIsRefused) {
  std::ofstream(folder_.File("file")) << "x";
  EXPECT_EQ(Open(folder_.File("file/log")), nullptr);
  EXPECT_EQ(error_.find("log file: "), 0U) << error_;
}

TEST_F(LogFileTest, AFullDiskIsToldOnce) {
  const auto log = Open("/dev/full");
  ASSERT_NE(log, nullptr) << error_;
  log->OnEvent(Token("A"));
  log->OnEvent(Token("B"));
  ASSERT_EQ(problems_.size(), 1U);
  EXPECT_EQ(problems_[0].find("the log is not complete: "), 0U) << problems_[0];
}

}  // namespace
