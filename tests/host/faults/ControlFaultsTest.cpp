// SPDX-License-Identifier: Apache-2.0
// The control socket when the process has no descriptor left, and when clients do not read.
#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/resource.h>
#include <unistd.h>

#include <chrono>
#include <ctime>
#include <fstream>
#include <vector>

#include "host/control/ControlServer.h"
#include "host/port/PseudoTerminal.h"
#include "tests/host/control/ControlFolder.h"
#include "tests/host/faults/RunBench.h"
#include "tests/support/Sanitized.h"

namespace {

using Json = nlohmann::json;

std::chrono::nanoseconds ProcessorTime() {
  timespec time{};
  (void)clock_gettime(CLOCK_PROCESS_CPUTIME_ID, &time);
  return std::chrono::seconds(time.tv_sec) + std::chrono::nanoseconds(time.tv_nsec);
}

// Takes every descriptor that this process may still open.
class NoDescriptors {
 public:
  NoDescriptors() {
    (void)getrlimit(RLIMIT_NOFILE, &former_);
    rlimit few = former_;
    few.rlim_cur = 64;
    (void)setrlimit(RLIMIT_NOFILE, &few);
    for (int taken = dup(STDERR_FILENO); taken >= 0; taken = dup(STDERR_FILENO)) {
      taken_.push_back(taken);
    }
  }
  ~NoDescriptors() {
    for (const int descriptor : taken_) {
      (void)close(descriptor);
    }
    (void)setrlimit(RLIMIT_NOFILE, &former_);
  }
  NoDescriptors(const NoDescriptors&) = delete;
  NoDescriptors& operator=(const NoDescriptors&) = delete;

  // Gives one back, which the next open takes.
  void GiveOne() {
    (void)close(taken_.back());
    taken_.pop_back();
  }

 private:
  rlimit former_{};
  std::vector<int> taken_;
};

TEST(ControlFaults, WithoutDescriptorsTheServerWaitsInsteadOfSpinning) {
#ifdef LOKA_SANITIZED
  GTEST_SKIP() << "a sanitizer needs descriptors of its own to look at an object";
#endif
  const ControlFolderForTest folder;
  std::string error;
  const auto server = ControlServer::Listen(
      "com1", [](const Json& /*request*/) { return Answer(); }, &error);
  ASSERT_NE(server, nullptr) << error;
  NoDescriptors none;
  none.GiveOne();
  ControlClient client(folder.File("com1.sock"));  // has taken the last one
  const auto begin = ProcessorTime();
  Deadline::After(500).Sleep();
  // A server that spins takes all of this time; a tenth is margin enough for one that wakes up
  // five times a second.
  EXPECT_LT(ProcessorTime() - begin, std::chrono::milliseconds(50));
  ASSERT_TRUE(client.Send("{\"op\":\"x\",\"id\":7}\n"));
  none.GiveOne();
  EXPECT_EQ(Json::parse(client.Line(), nullptr, false).value("id", 0), 7);
}

// The same in the program: it says so, goes on, and lets the next client in later.
TEST(ControlFaults, WithoutDescriptorsAnInstanceSaysSoAndGoesOn) {
#ifdef LOKA_SANITIZED
  GTEST_SKIP() << "a sanitizer needs descriptors of its own to look at an object";
#endif
  constexpr int kClients = 30;  // more than there are descriptors, less than those and the backlog
  const RunBench bench;
  const PseudoTerminal line;
  const auto run = bench.BeginReady(line.Path(), "rx_suffix=0A", {"-v"}, "prlimit --nofile=32");
  std::vector<std::unique_ptr<ControlClient>> clients;
  for (int i = 0; i < kClients; ++i) {
    clients.push_back(std::make_unique<ControlClient>(bench.SocketFile()));
  }
  EXPECT_TRUE(run->AwaitErrors("nobody else can attach for now: Too many open files"))
      << run->Errors();
  // The receive path needs no new descriptor.
  ASSERT_TRUE(line.Send("A\n", Deadline::After(ProgramRun::kLimitMs)));
  EXPECT_TRUE(run->AwaitErrors("\"A\"")) << run->Errors();
  EXPECT_EQ(clients.front()->Ask(R"({"op":"waiting","id":1})").value("id", 0), 1);
  clients.erase(clients.begin(), clients.end() - 1);
  EXPECT_EQ(clients.back()->Ask(R"({"op":"waiting","id":2})").value("id", 0), 2);
}

// A watcher that stops reading loses events and is told how many; the instance goes on.
TEST(ControlFaults, AWatcherThatDoesNotReadHoldsNobodyUp) {
  constexpr int kTokens = 12000;
  const RunBench bench;
  const PseudoTerminal line;
  const auto run = bench.BeginReady(line.Path(), "rx_suffix=0A token_queue_size=10000");
  const auto watcher = bench.Command({"sub", "--attach", "-j"});
  ASSERT_TRUE(watcher->AwaitErrors("attached to the running instance"));
  // Its first line shows that it listens.
  ASSERT_TRUE(line.Send("first\n", Deadline::After(ProgramRun::kLimitMs)));
  while (watcher->Line().find("first") == std::string::npos) {
  }
  const std::string filler(60, 'x');
  for (int i = 0; i < kTokens; ++i) {
    ASSERT_TRUE(
        line.Send(std::to_string(i) + filler + "\n", Deadline::After(ProgramRun::kLimitMs)));
    // The queue must not be what loses any.
    if (i % 1000 == 999) {
      ASSERT_TRUE(bench.AwaitCount("tokens", static_cast<std::uint64_t>(i) + 2));
    }
  }
  EXPECT_EQ(bench.Count("findings"), 0U);
  // Now it reads again: what it gets is in order, and what it does not get is told as a number.
  int last = -1;
  int seen = 0;
  std::uint64_t missed = 0;
  while (missed == 0) {
    const std::string text = watcher->Line();
    ASSERT_NE(text, "(none)");
    const Json event = Json::parse(text);
    if (event.value("ev", "") == "token") {
      const int number = std::stoi(event.value("text", "").substr(0, 5));
      EXPECT_LT(last, number);
      last = number;
      ++seen;
    } else if (event.value("text", "").find("events were not read in time") != std::string::npos) {
      missed = std::stoul(event.value("text", ""));
    }
  }
  ASSERT_TRUE(line.Send("last\n", Deadline::After(ProgramRun::kLimitMs)));
  while (watcher->Line().find("\"last\"") == std::string::npos) {
  }
  EXPECT_LT(seen, kTokens);
  EXPECT_GE(static_cast<std::uint64_t>(seen) + missed, static_cast<std::uint64_t>(kTokens));
}

}  // namespace
