// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <atomic>
#include <thread>

#include "host/runtime/PosixMultiTask.h"
#include "interfaces/ITaskRunner.h"
#include "tests/host/support/TestLimit.h"

namespace {

// Runs until the task is asked to end and the test lets it go.
class PatientRunner final : public ITaskRunner {
 public:
  void Task() override {
    ++runs;
    while (task.load() == nullptr || task.load()->IsToEnd() == 0 || !mayEnd) {
      std::this_thread::yield();
    }
    hasEnded = true;
  }

  std::atomic<ITask*> task{nullptr};
  std::atomic<int> runs{0};
  std::atomic<bool> mayEnd{true};
  std::atomic<bool> hasEnded{false};
};

TEST(PosixMultiTask, RunsATaskOnceAndEndsIt) {
  PosixMultiTask multiTask;
  PatientRunner runner;
  ITask* const task = multiTask.CreateTask(&runner, 3);
  ASSERT_NE(task, nullptr);
  runner.task = task;
  EXPECT_EQ(runner.runs, 0);
  EXPECT_EQ(task->Start(), 1);
  EXPECT_EQ(task->Start(), 0);
  EXPECT_EQ(task->IsToEnd(), 0);
  EXPECT_EQ(multiTask.StopTask(task, kLimitMs), 1);
  EXPECT_EQ(runner.runs, 1);
  EXPECT_TRUE(runner.hasEnded);
  EXPECT_EQ(multiTask.TaskCount(), 0U);
}

TEST(PosixMultiTask, TaskThatDoesNotEndInTimeStaysValid) {
  PosixMultiTask multiTask;
  PatientRunner runner;
  runner.mayEnd = false;
  ITask* const task = multiTask.CreateTask(&runner, 3);
  runner.task = task;
  ASSERT_EQ(task->Start(), 1);
  EXPECT_EQ(multiTask.StopTask(task, 1), 0);
  EXPECT_EQ(multiTask.TaskCount(), 1U);
  EXPECT_NE(task->IsToEnd(), 0);
  EXPECT_FALSE(runner.hasEnded);
  runner.mayEnd = true;
  EXPECT_EQ(multiTask.StopTask(task, kLimitMs), 1);
  EXPECT_TRUE(runner.hasEnded);
  EXPECT_EQ(multiTask.TaskCount(), 0U);
}

TEST(PosixMultiTask, RefusesTasksItDoesNotKnow) {
  PosixMultiTask multiTask;
  PatientRunner runner;
  ITask* const task = multiTask.CreateTask(&runner, 3);
  runner.task = task;
  task->Start();
  ASSERT_EQ(multiTask.StopTask(task, kLimitMs), 1);
  EXPECT_EQ(multiTask.StopTask(task, kLimitMs), 0);
  EXPECT_EQ(multiTask.StopTask(nullptr, 0), 0);
}

TEST(PosixMultiTask, TaskThatWasNeverStartedEndsAtOnce) {
  PosixMultiTask multiTask;
  PatientRunner runner;
  ITask* const task = multiTask.CreateTask(&runner, 3);
  EXPECT_EQ(multiTask.StopTask(task, 0), 1);
  EXPECT_EQ(runner.runs, 0);
}

TEST(PosixMultiTask, NeedsARunner) {
  PosixMultiTask multiTask;
  EXPECT_EQ(multiTask.CreateTask(nullptr, 3), nullptr);
}

TEST(PosixMultiTask, TaskCannotStopItself) {
  class SelfStopper final : public ITaskRunner {
   public:
    explicit SelfStopper(PosixMultiTask* service) : multiTask(service) {}
    void Task() override {
      while (task.load() == nullptr) {
        std::this_thread::yield();
      }
      answer = multiTask->StopTask(task.load(), kLimitMs);
    }
    PosixMultiTask* multiTask;
    std::atomic<ITask*> task{nullptr};
    std::atomic<int> answer{-1};
  };
  PosixMultiTask multiTask;
  SelfStopper runner(&multiTask);
  ITask* const task = multiTask.CreateTask(&runner, 3);
  task->Start();
  runner.task = task;
  while (runner.answer < 0) {
    std::this_thread::yield();
  }
  EXPECT_EQ(runner.answer, 0);
  EXPECT_EQ(multiTask.StopTask(task, kLimitMs), 1);
}

TEST(PosixMultiTask, EndsAllTasksThatAreLeft) {
  PosixMultiTask multiTask;
  PatientRunner runners[3];
  for (PatientRunner& runner : runners) {
    ITask* const task = multiTask.CreateTask(&runner, 3);
    runner.task = task;
    task->Start();
  }
  EXPECT_TRUE(multiTask.EndTasks(kLimitMs));
  EXPECT_EQ(multiTask.TaskCount(), 0U);
}

TEST(PosixMultiTask, GivesOutAndTakesBackSemaphores) {
  PosixMultiTask multiTask;
  ISemaphore* const first = multiTask.CreateSemaphore(0);
  // The argument has no meaning: whatever it is, the semaphore is free.
  ISemaphore* const second = multiTask.CreateSemaphore(7);
  ASSERT_NE(first, nullptr);
  ASSERT_NE(second, nullptr);
  EXPECT_NE(second->Lock(), 0);
  EXPECT_NE(second->Unlock(), 0);
  EXPECT_EQ(multiTask.SemaphoreCount(), 2U);
  multiTask.DeleteSemaphore(first);
  multiTask.DeleteSemaphore(first);
  multiTask.DeleteSemaphore(nullptr);
  EXPECT_EQ(multiTask.SemaphoreCount(), 1U);
  multiTask.DeleteSemaphore(second);
  EXPECT_EQ(multiTask.SemaphoreCount(), 0U);
}

TEST(PosixMultiTask, SleepingZeroOrLessComesBack) {
  PosixMultiTask multiTask;
  multiTask.Sleep(0);
  multiTask.Sleep(-1);
}

}  // namespace
