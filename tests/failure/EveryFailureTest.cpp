// SPDX-License-Identifier: Apache-2.0
// Every operation of the driver with its n-th allocation failing, and with its n-th host call
// failing, for every n up to the end; once, and from then on. Whatever fails: nothing escapes from
// an interface operation, no semaphore stays locked, no token that waited is lost, nothing leaks,
// no rule of the host's objects is broken, and the same call works when the cause is gone.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdio>
#include <set>
#include <string>
#include <tuple>

#include "tests/failure/Step.h"
#include "tests/unit/FailingNew.h"

namespace {

enum class What { kAllocation, kHostCall };
enum class Mode { kOnce, kFromThenOn };

using Case = std::tuple<std::size_t, What, Mode>;

// More faults than any operation has places for: a loop without an end is a failure too.
constexpr int kMostFaults = 2000;

// What became of the step while the fault was armed.
struct Outcome {
  bool succeeded = false;
  bool escaped = false;
  bool wasHit = false;
  bool mayFail = false;  // something failed that the operation needs
};

class EveryFailureTest : public ::testing::TestWithParam<Case> {
 protected:
  const Step& TheStep() const { return AllSteps()[std::get<0>(GetParam())]; }
  What TheKind() const { return std::get<1>(GetParam()); }
  bool IsFromThenOn() const { return std::get<2>(GetParam()) == Mode::kFromThenOn; }

  static void RunCaught(const Step& step, Bench& bench, Outcome& outcome) {
    try {
      outcome.succeeded = step.run(bench);
    } catch (...) {
      outcome.escaped = true;
    }
  }

  // A stored value that is not there leaves the configured one; what becomes of sent bytes is the
  // port's business.
  static bool IsNeeded(const std::set<std::string>& operations) {
    static const std::set<std::string> kOfNoAccount = {
        "Exists", "GetString", "GetStringInto", "GetBoolean", "GetInteger", "ConvertTo", "Send"};
    return std::any_of(operations.begin(), operations.end(), [](const std::string& operation) {
      return kOfNoAccount.count(operation) == 0;
    });
  }

  Outcome RunWithFault(Bench& bench, int nth) const {
    Outcome outcome;
    if (TheKind() == What::kAllocation) {
      const FailingNew noMemory(
          nth, IsFromThenOn() ? FailingNew::Mode::kFromThenOn : FailingNew::Mode::kOnce);
      RunCaught(TheStep(), bench, outcome);
      outcome.wasHit = noMemory.HasFailed();
      outcome.mayFail = outcome.wasHit;
      return outcome;
    }
    FaultPlan& faults = bench.host.Faults();
    faults.Clear();
    if (IsFromThenOn()) {
      faults.FailAllFrom(nth);
    } else {
      faults.FailNthOfAll(nth);
    }
    RunCaught(TheStep(), bench, outcome);
    outcome.wasHit = faults.FailedCount() != 0;
    outcome.mayFail = IsNeeded(faults.FailedOperations());
    faults.Clear();
    return outcome;
  }

  void CheckTokens(Bench& bench) const {
    const Step::Tokens tokens = TheStep().tokens;
    const bool areThere = tokens == Step::Tokens::kStay || tokens == Step::Tokens::kMove;
    if (bench.protocol == nullptr || !areThere) return;
    EXPECT_GE(bench.TokenCount(), 2) << "a token that waited is lost";
    const std::string front = bench.Front();
    EXPECT_TRUE(front == "kept one" || tokens == Step::Tokens::kMove) << front;
  }

  // The operation again, now that nothing fails, and a day's work after it.
  void CheckRecovery(Bench& bench, const Outcome& outcome) const {
    if (bench.protocol == nullptr && TheStep().name.compare(0, 6, "Delete") == 0) return;
    if (!outcome.succeeded) {
      TheStep().again(bench);
      EXPECT_TRUE(TheStep().run(bench)) << "the same call still fails";
    }
    CheckTokens(bench);
    if (bench.protocol == nullptr) bench.Create();
    EXPECT_EQ(bench.WhatFails(), "") << "does not work any more";
  }

  // One life with the n-th fault. False once there is no n-th fault any more.
  bool LiveWithFault(int nth) const {
    Bench bench;
    TheStep().prepare(bench);
    const Outcome outcome = RunWithFault(bench, nth);
    EXPECT_FALSE(outcome.escaped) << "an exception left the driver";
    EXPECT_FALSE(bench.host.MultiTask().IsAnySemaphoreHeld());
    EXPECT_EQ(bench.host.Log().Violations(), "");
    EXPECT_TRUE(outcome.succeeded || outcome.mayFail)
        << "fails although nothing that it needs failed";
    if (TheKind() == What::kHostCall && bench.protocol != nullptr) {
      EXPECT_STRNE(bench.protocol->GetLastErrorString(), "Out of memory");
    }
    CheckTokens(bench);
    CheckRecovery(bench, outcome);
    EXPECT_EQ(bench.End(), "");
    return outcome.wasHit;
  }
};

// So that the figure can be published: how many faults there were.
int faultsInjected[2] = {};

TEST_P(EveryFailureTest, IsSurvived) {
  if (TheKind() == What::kHostCall && !TheStep().hasFewHostCalls) return;
  LiveWithFault(1);  // what is made once and kept is made now
  int nth = 1;
  for (bool isHit = true; isHit && !HasFailure(); ++nth) {
    SCOPED_TRACE("fault " + std::to_string(nth));
    static_cast<void>(LiveWithFault(nth));  // what only this fault makes and keeps
    const long long living = FailingNew::Living();
    isHit = LiveWithFault(nth);
    EXPECT_EQ(FailingNew::Living(), living) << "memory was not given back";
    ASSERT_LT(nth, kMostFaults);
    faultsInjected[static_cast<int>(TheKind())] += isHit ? 1 : 0;
  }
}

std::string NameOf(const ::testing::TestParamInfo<Case>& info) {
  return AllSteps()[std::get<0>(info.param)].name +
         (std::get<1>(info.param) == What::kAllocation ? "_allocation" : "_host_call") +
         (std::get<2>(info.param) == Mode::kOnce ? "_once" : "_from_then_on");
}

INSTANTIATE_TEST_SUITE_P(Step, EveryFailureTest,
                         ::testing::Combine(::testing::Range<std::size_t>(0, AllSteps().size()),
                                            ::testing::Values(What::kAllocation, What::kHostCall),
                                            ::testing::Values(Mode::kOnce, Mode::kFromThenOn)),
                         NameOf);

// The loaded library allocates through this program, so its allocations are the ones that fail.
TEST(FailureTest, TheLibrarysAllocationsAreReached) {
  Bench bench;
  bench.Create();
  const long long before = FailingNew::Count();
  EXPECT_NE(bench.protocol->Config(Texts::kConfig.c_str()), 0);
  EXPECT_GT(FailingNew::Count(), before + 10);
  const FailingNew noMemory(1);
  EXPECT_EQ(bench.protocol->Config(Texts::kConfig.c_str()), 0);
  EXPECT_TRUE(noMemory.HasFailed());
}

class FaultFigures : public ::testing::Environment {
 public:
  void TearDown() override {
    std::printf("%d allocations and %d host calls failed\n", faultsInjected[0], faultsInjected[1]);
  }
};

const auto* const kFigures = ::testing::AddGlobalTestEnvironment(new FaultFigures);

}  // namespace
