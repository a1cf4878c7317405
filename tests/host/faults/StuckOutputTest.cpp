// SPDX-License-Identifier: Apache-2.0
// Nobody reads what the program writes: a full pipe, a terminal that has stopped. One signal ends
// it within its limit, a second one at once, and a terminal gets its state back.
#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/ioctl.h>
#include <sys/stat.h>
#include <termios.h>
#include <unistd.h>

#include <chrono>
#include <stdexcept>

#include "host/port/PseudoTerminal.h"
#include "tests/host/faults/RunBench.h"

namespace {

constexpr int kTokens = 5000;

// Ends later than it should only when the machine is very busy: half as long again as the limit of
// 8000 ms.
constexpr int kEndLimitMs = 12000;

void SendTokens(const PseudoTerminal& line) {
  const std::string filler(60, 'x');
  for (int i = 0; i < kTokens; ++i) {
    ASSERT_TRUE(line.Send(filler + "\n", Deadline::After(ProgramRun::kLimitMs)));
  }
}

// Nobody reads its standard output.
class StuckSub {
 public:
  StuckSub()
      : run_(bench_.Command({"sub", line_.Path(), "--no-attach", "--no-store", "--config",
                             TestConfiguration("rx_suffix=0A token_queue_size=10000")})) {
    SendTokens(line_);
    // Full once it has written what a pipe takes and writes nothing more.
    const Deadline limit = Deadline::After(ProgramRun::kLimitMs);
    for (long before = -1; before < kPipeBytes || before != WrittenBytes();) {
      if (limit.HasPassed()) {
        throw std::runtime_error("the pipe is not full");
      }
      before = WrittenBytes();
      Deadline::After(300).Sleep();
    }
  }
  ProgramRun& Run() { return *run_; }

 private:
  static constexpr long kPipeBytes = 60000;

  long WrittenBytes() const {
    std::ifstream file("/proc/" + std::to_string(run_->ProcessId()) + "/io");
    for (std::string name; file >> name;) {
      long value = 0;
      file >> value;
      if (name == "wchar:") {
        return value;
      }
    }
    return 0;
  }

  RunBench bench_;
  PseudoTerminal line_;
  std::unique_ptr<ProgramRun> run_;
};

TEST(StuckOutput, OneSignalEndsItAllTheSame) {
  StuckSub sub;
  const auto begin = std::chrono::steady_clock::now();
  sub.Run().Signal(SIGTERM);
  EXPECT_EQ(sub.Run().Status(), 128 + SIGTERM);
  EXPECT_LT(std::chrono::steady_clock::now() - begin, std::chrono::milliseconds(kEndLimitMs));
}

// The journal of a service that does not read.
TEST(StuckOutput, AnInstanceWhoseMessagesNobodyReadsGoesOn) {
  const RunBench bench;
  const PseudoTerminal line;
  const std::string pipePath = bench.File("journal");
  ASSERT_EQ(mkfifo(pipePath.c_str(), 0600), 0);
  const int journal = open(pipePath.c_str(), O_RDWR | O_CLOEXEC | O_NONBLOCK);
  const auto run = bench.Begin(line.Path(), "rx_suffix=0A", {"-v"},
                               "sh -c 'exec \"$0\" \"$@\" 2>\"" + pipePath + "\"'");
  std::string messages;
  const auto readJournal = [&] {
    char bytes[65536];
    const ssize_t count = read(journal, bytes, sizeof bytes);
    messages.append(bytes, count > 0 ? static_cast<std::size_t>(count) : 0);
    return count > 0;
  };
  const Deadline ready = Deadline::After(ProgramRun::kLimitMs);
  while (messages.find("commands attach at") == std::string::npos && !ready.HasPassed()) {
    (void)readJournal();
    Deadline::After(5).Sleep();
  }
  // About a line of 100 bytes each, far more than the pipe and what may wait for it.
  const std::string filler(60, 'x');
  for (int sent = 0; sent < 4 * kTokens; ++sent) {
    ASSERT_TRUE(line.Send(filler + "\n", Deadline::After(ProgramRun::kLimitMs)));
    if (sent % 50 == 49) {
      ASSERT_TRUE(bench.AwaitCount("tokens", static_cast<std::uint64_t>(sent) + 1));
    }
  }
  EXPECT_EQ(bench.Count("tokens"), 4U * kTokens);
  // Once it reads again it is told how much it has missed.
  const Deadline told = Deadline::After(ProgramRun::kLimitMs);
  while (messages.find("lines were not read in time") == std::string::npos && !told.HasPassed()) {
    (void)readJournal();
    (void)line.Send("more\n", Deadline::After(ProgramRun::kLimitMs));
    Deadline::After(5).Sleep();
  }
  EXPECT_NE(messages.find("lines were not read in time"), std::string::npos);
  run->Signal(SIGTERM);
  EXPECT_EQ(run->Status(), 128 + SIGTERM);
  (void)close(journal);
}

// "loka term" on a terminal whose other end reads nothing any more.
class StuckTerm : public testing::Test {
 protected:
  StuckTerm() {
    terminal_ = posix_openpt(O_RDWR | O_NOCTTY | O_CLOEXEC | O_NONBLOCK);
    (void)grantpt(terminal_);
    (void)unlockpt(terminal_);
    name_ = ptsname(terminal_);
    user_ = open(name_.c_str(), O_RDWR | O_NOCTTY | O_CLOEXEC);
    (void)tcgetattr(user_, &before_);
  }
  ~StuckTerm() override {
    (void)close(user_);
    (void)close(terminal_);
  }

  termios Now() const {
    termios now{};
    (void)tcgetattr(user_, &now);
    return now;
  }
  bool IsPutBack() const {
    const termios now = Now();
    return now.c_iflag == before_.c_iflag && now.c_oflag == before_.c_oflag &&
           now.c_lflag == before_.c_lflag && now.c_cflag == before_.c_cflag;
  }

  // Full once it holds much and no more comes for a while.
  bool AwaitFullTerminal(const Deadline& limit) const {
    constexpr int kMuch = 2000;
    constexpr int kQuietMs = 300;
    int held = -1;
    for (int before = -2; (held < kMuch || held != before) && !limit.HasPassed();) {
      before = held;
      Deadline::After(kQuietMs).Sleep();
      (void)ioctl(terminal_, FIONREAD, &held);
    }
    return held >= kMuch;
  }

  RunBench bench_;
  PseudoTerminal line_;
  int terminal_ = -1;
  int user_ = -1;
  std::string name_;
  termios before_{};
};

TEST_F(StuckTerm, ASecondSignalEndsItAtOnceAndPutsTheTerminalBack) {
  const auto term = bench_.Command(
      {"term", line_.Path(), "--no-attach", "--no-store", "--config",
       TestConfiguration("rx_suffix=0A token_queue_size=10000")},
      "TERM=xterm setsid sh -c 'exec \"$0\" \"$@\" <\"" + name_ + "\" >\"" + name_ + "\" 2>&1'");
  const Deadline limit = Deadline::After(ProgramRun::kLimitMs);
  while (IsPutBack() && !limit.HasPassed()) {
    Deadline::After(5).Sleep();
  }
  ASSERT_FALSE(IsPutBack()) << "the terminal was never changed";
  SendTokens(line_);
  // What the terminal still took was shown; from here on it writes to nobody.
  ASSERT_TRUE(AwaitFullTerminal(limit));
  const auto begin = std::chrono::steady_clock::now();
  term->Signal(SIGTERM);
  Deadline::After(300).Sleep();
  ASSERT_FALSE(IsPutBack()) << "it has ended with the first one: nothing is tested";
  term->Signal(SIGINT);
  EXPECT_EQ(term->Status(), 128 + SIGINT);
  EXPECT_TRUE(IsPutBack());
  EXPECT_LT(std::chrono::steady_clock::now() - begin, std::chrono::milliseconds(5000));
}

}  // namespace
