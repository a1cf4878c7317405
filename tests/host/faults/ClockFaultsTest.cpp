// SPDX-License-Identifier: Apache-2.0
// Somebody sets the clock while an instance runs: by hand, or the network's time arrives late.
#include <gtest/gtest.h>

#include <cstdint>
#include <fstream>
#include <string>

#include "host/events/WallClock.h"
#include "host/port/PseudoTerminal.h"
#include "tests/host/faults/RunBench.h"
#include "tests/support/Sanitized.h"

namespace {

using Json = nlohmann::json;

constexpr std::int64_t kUsPerHour = 3600LL * 1000000;

// The clock of programs that run with Environment().
class SettableClock {
 public:
  explicit SettableClock(std::string file) : file_(std::move(file)) { Set(0); }

  std::string Environment() const {
    return "LD_PRELOAD='" LOKA_SET_CLOCK_PATH "' LOKA_SET_CLOCK='" + file_ + "' ";
  }

  // So much later than the machine's own clock.
  void Set(std::int64_t offsetUs) const {
    // In place: the program has the file mapped.
    std::fstream file(file_, std::ios::in | std::ios::out | std::ios::binary);
    if (!file) {
      file.open(file_, std::ios::out | std::ios::binary);
    }
    file.write(reinterpret_cast<const char*>(&offsetUs), sizeof offsetUs);
  }

 private:
  const std::string file_;
};

class ClockFaults : public testing::Test {
 protected:
  void SetUp() override {
#ifdef LOKA_SANITIZED
    GTEST_SKIP() << "a sanitizer has to be loaded in front of everything else";
#endif
  }

  // The device sends a token that only a silence ends; returns its event and keeps the notes that
  // came in front of it.
  Json Token(ProgramRun* watcher, const std::string& token) {
    EXPECT_TRUE(line_.Send(token, Deadline::After(ProgramRun::kLimitMs)));
    for (;;) {
      const std::string text = watcher->Line();
      const Json event = Json::parse(text, nullptr, false);
      const std::string kind = event.value("ev", "token");
      EXPECT_NE(kind, "finding") << text;
      EXPECT_NE(kind, "drop") << text;
      if (kind == "note") {
        notes_ += event.value("text", "") + "\n";
      } else if (kind == "token") {
        EXPECT_EQ(event.value("text", ""), token) << text;
        return event;
      }
    }
  }

  static std::int64_t TimeUs(const Json& event) {
    std::int64_t timeUs = 0;
    EXPECT_TRUE(ParseUtcText(event.value("t", ""), &timeUs)) << event;
    return timeUs;
  }

  RunBench bench_;
  const PseudoTerminal line_;
  const SettableClock clock_{bench_.File("clock")};
  std::string notes_;
};

TEST_F(ClockFaults, AClockThatIsSetChangesTimeStampsOnlyAndIsTold) {
  const auto run = bench_.Begin(line_.Path(), "gap=20", {}, clock_.Environment());
  ASSERT_TRUE(run->AwaitErrors("commands attach at")) << run->Errors();
  const auto sub = bench_.Command({"sub", "-j"});
  ASSERT_TRUE(sub->AwaitErrors("attached")) << sub->Errors();
  const std::int64_t first = TimeUs(Token(sub.get(), "one"));
  EXPECT_EQ(notes_, "");

  clock_.Set(-kUsPerHour);
  const std::int64_t second = TimeUs(Token(sub.get(), "two"));
  EXPECT_NEAR(static_cast<double>(second - first), -static_cast<double>(kUsPerHour), 60e6);
  EXPECT_NE(notes_.find("was set back by 3600 s"), std::string::npos) << notes_;
  notes_.clear();
  (void)Token(sub.get(), "three");
  EXPECT_EQ(notes_, "");

  clock_.Set(kUsPerHour);
  (void)Token(sub.get(), "four");
  EXPECT_NE(notes_.find("was set forward by 7200 s"), std::string::npos) << notes_;

  // What is stored now is newer for the driver all the same, and there after the next start.
  const auto set = bench_.Command({"set", "gap=30"});
  EXPECT_EQ(set->Status(), 0) << set->Errors();
  EXPECT_EQ(bench_.Count("findings"), 0U);
  run->Signal(SIGTERM);
  EXPECT_EQ(run->Status(), 128 + SIGTERM) << run->Errors();
  const auto stored = bench_.Command({"store", "ls"});
  EXPECT_NE(stored->Output().find("30"), std::string::npos);
}

}  // namespace
