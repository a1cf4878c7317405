// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <atomic>
#include <memory>
#include <thread>

#include "driver/Protocol_LOKA.h"
#include "driver/TaskRunner_LOKA.h"
#include "tests/unit/HostInUse.h"

namespace {

class TaskRunner_LOKATest : public testing::Test {
 protected:
  TaskRunner_LOKATest() { host_->Log().Take(); }

  HostInUse host_;
  Protocol_LOKA protocol_;  // never started: a pass only sleeps 10 ms
  TaskRunner_LOKA runner_{piMultiTask, protocol_};
};

}  // namespace

TEST_F(TaskRunner_LOKATest, CreatesAndStartsATaskOnce) {
  host_->Log().Take();
  runner_.Start();
  EXPECT_EQ(host_->Log().Take(), "CreateTask 3\ntask.Start\n");
  runner_.Start();
  EXPECT_EQ(host_->Log().Take(), "");
  runner_.Stop();
}

TEST_F(TaskRunner_LOKATest, PassesAndYieldsInTurn) {
  runner_.Start();
  host_->Log().Take();
  host_->RunPasses(2);
  EXPECT_EQ(host_->Log().Take(),
            "IsToEnd -> 0\nSleep 10\nSleep 0\nIsToEnd -> 0\nSleep 10\nSleep 0\nIsToEnd -> 1\n");
  runner_.Stop();
}

TEST_F(TaskRunner_LOKATest, StopsWithinASecond) {
  runner_.Start();
  host_->Log().Take();
  runner_.Stop();
  EXPECT_EQ(host_->Log().Take(), "StopTask 1000 -> 1\n");
  runner_.Stop();
  EXPECT_EQ(host_->Log().Take(), "");
  runner_.Start();
  EXPECT_EQ(host_->Log().Take(), "CreateTask 3\ntask.Start\n");
  runner_.Stop();
}

TEST_F(TaskRunner_LOKATest, TaskThatDoesNotStopStaysHeld) {
  runner_.Start();
  host_->Faults().FailNth("StopTask", 1);
  runner_.Stop();
  host_->Log().Take();
  runner_.Start();
  EXPECT_EQ(host_->Log().Take(), "");
  runner_.Stop();
  EXPECT_EQ(host_->Log().Take(), "StopTask 1000 -> 1\n");
}

TEST_F(TaskRunner_LOKATest, WithoutATaskTheRunReturnsAtOnce) {
  host_->Log().Take();
  runner_.Task();
  EXPECT_EQ(host_->Log().Take(), "");
}

TEST_F(TaskRunner_LOKATest, HostThatGivesNoTaskIsAskedAgain) {
  host_->Faults().FailNth("CreateTask", 1);
  runner_.Start();
  host_->Log().Take();
  runner_.Start();
  EXPECT_EQ(host_->Log().Take(), "CreateTask 3\ntask.Start\n");
  runner_.Stop();
}

TEST_F(TaskRunner_LOKATest, WithoutATaskServiceNothingRuns) {
  TaskRunner_LOKA runner(nullptr, protocol_);
  runner.Start();
  runner.Stop();
  runner.Finish();
  runner.Task();
  EXPECT_EQ(runner.MultiTask(), nullptr);
  EXPECT_EQ(runner_.MultiTask(), piMultiTask);
}

TEST_F(TaskRunner_LOKATest, FinishWaitsForATaskThatTheHostCouldNotStop) {
  host_->MultiTask().SetThreaded(true);
  auto runner = std::make_unique<TaskRunner_LOKA>(piMultiTask, protocol_);
  std::atomic<bool> runs{false};
  host_->MultiTask().OnSleep([&runs](int) { runs = true; });
  runner->Start();
  while (!runs) {
    std::this_thread::yield();
  }
  host_->Faults().FailAlways("StopTask");
  runner->Finish();
  // The task has left the runner: nothing of it may be touched from here on.
  runner.reset();
  host_->MultiTask().OnSleep(nullptr);
  host_->Faults().Clear();
  host_->MultiTask().LastTask()->End();
}
