// SPDX-License-Identifier: Apache-2.0
#include <fcntl.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <array>
#include <condition_variable>
#include <mutex>

#include "host/term/KeyInput.h"

namespace {

// The reading end is what somebody types on.
class Pipe {
 public:
  Pipe() { EXPECT_EQ(pipe2(ends_.data(), O_CLOEXEC), 0); }
  ~Pipe() {
    Close();
    (void)close(ends_[0]);
  }
  Pipe(const Pipe&) = delete;
  Pipe& operator=(const Pipe&) = delete;

  int ReadEnd() const { return ends_[0]; }
  void Write(const std::string& bytes) const {
    ASSERT_EQ(write(ends_[1], bytes.data(), bytes.size()), static_cast<ssize_t>(bytes.size()));
  }
  void Close() {
    if (ends_[1] >= 0) {
      (void)close(ends_[1]);
      ends_[1] = -1;
    }
  }

 private:
  std::array<int, 2> ends_{-1, -1};
};

class KeyInputTest : public testing::Test {
 protected:
  // Waits for the reading thread.
  template <class Condition>
  void Await(Condition isMet) {
    std::unique_lock<std::mutex> lock(mutex_);
    ASSERT_TRUE(changed_.wait_for(lock, std::chrono::seconds(20), isMet));
  }
  std::string Line() {
    Await([this] { return input_.HasLine(); });
    std::string line;
    return input_.TakeLine(&line) ? line : "(none)";
  }

  Pipe pipe_;
  std::mutex mutex_;
  std::condition_variable changed_;
  KeyInput input_{pipe_.ReadEnd(), [this] {
                    const std::lock_guard<std::mutex> lock(mutex_);
                    changed_.notify_all();
                  }};
};

TEST_F(KeyInputTest, GivesBytesOneByOneAndThenTheEnd) {
  char byte = 0;
  EXPECT_FALSE(input_.HasByte());
  EXPECT_FALSE(input_.TakeByte(&byte));
  pipe_.Write(std::string("a\0", 2));
  Await([this] { return input_.HasByte(); });
  EXPECT_TRUE(input_.TakeByte(&byte));
  EXPECT_EQ(byte, 'a');
  EXPECT_TRUE(input_.TakeByte(&byte));
  EXPECT_EQ(byte, '\0');
  EXPECT_FALSE(input_.TakeByte(&byte));
  EXPECT_FALSE(input_.IsAtEnd());
  pipe_.Close();
  Await([this] { return input_.IsAtEnd(); });
  EXPECT_TRUE(input_.HasByte());
  EXPECT_FALSE(input_.TakeByte(&byte));
}

TEST_F(KeyInputTest, CutsLinesAtBothLineEnds) {
  pipe_.Write("one\r\n\ntwo\rthree\nrest");
  EXPECT_EQ(Line(), "one");
  EXPECT_EQ(Line(), "");
  EXPECT_EQ(Line(), "two\rthree");
  std::string line;
  EXPECT_FALSE(input_.HasLine());
  EXPECT_FALSE(input_.TakeLine(&line));
  pipe_.Write(" of it");
  pipe_.Close();
  EXPECT_EQ(Line(), "rest of it");
  EXPECT_TRUE(input_.IsAtEnd());
  EXPECT_FALSE(input_.TakeLine(&line));
}

TEST_F(KeyInputTest, ALineWithoutEndIsTakenInParts) {
  const std::string part(KeyInput::kMaxLineBytes / 16, 'x');
  for (int i = 0; i < 16; ++i) {
    pipe_.Write(part);
  }
  EXPECT_GE(Line().size(), KeyInput::kMaxLineBytes);
}

// The reader waits for room and must end all the same.
TEST_F(KeyInputTest, EndsWhileNobodyTakesWhatIsThere) {
  ASSERT_GE(fcntl(pipe_.ReadEnd(), F_SETPIPE_SZ, 1 << 20), 1 << 20);
  pipe_.Write(std::string(KeyInput::kMaxLineBytes * 2, '\n'));
  Await([this] { return input_.HasByte(); });
}

}  // namespace
