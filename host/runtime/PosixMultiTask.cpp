// SPDX-License-Identifier: Apache-2.0
#include "host/runtime/PosixMultiTask.h"

#include <sched.h>

#include <algorithm>
#include <ctime>
#include <new>

#include "host/base/Deadline.h"
#include "interfaces/CompareInterface.h"

namespace {

// Gives the processor away, but once a tick of the system's clock and thread at most: the kernel
// shares processors out by itself, and between two ticks nobody is kept waiting for long.
void YieldOnceATick() {
  thread_local timespec lastYield{};
  timespec now{};
  (void)clock_gettime(CLOCK_MONOTONIC_COARSE, &now);
  if (now.tv_nsec != lastYield.tv_nsec || now.tv_sec != lastYield.tv_sec) {
    lastYield = now;
    (void)sched_yield();
  }
}

}  // namespace

PosixMultiTask::PosixMultiTask() { PosixSemaphore::Prepare(); }

PosixMultiTask::~PosixMultiTask() {
  for (const std::shared_ptr<PosixTask>& task : tasks_) {
    task->RequestEnd();
  }
}

void* PosixMultiTask::ConvertTo(const char* name) {
  const bool isOurs =
      CompareInterface(name, "PosixMultiTask") || CompareInterface(name, "IMultiTask2");
  return isOurs ? this : nullptr;
}

std::shared_ptr<PosixTask> PosixMultiTask::FindTask(const ITask* task) const {
  const std::lock_guard<std::mutex> lock(mutex_);
  const auto found = std::find_if(tasks_.begin(), tasks_.end(),
                                  [&](const auto& known) { return known.get() == task; });
  return found == tasks_.end() ? nullptr : *found;
}

int PosixMultiTask::StopTask(ITask* task, int timeoutMs) {
  const std::shared_ptr<PosixTask> known = FindTask(task);
  if (known == nullptr || known->IsCurrentThread()) {
    return 0;
  }
  known->RequestEnd();
  if (!known->WaitForEnd(Deadline::After(timeoutMs))) {
    return 0;
  }
  const std::lock_guard<std::mutex> lock(mutex_);
  tasks_.erase(std::remove(tasks_.begin(), tasks_.end(), known), tasks_.end());
  return 1;
}

ISemaphore* PosixMultiTask::CreateSemaphore(int /*reserved*/) {
  try {
    auto semaphore = std::make_unique<PosixSemaphore>();
    const std::lock_guard<std::mutex> lock(mutex_);
    semaphores_.push_back(std::move(semaphore));
    return semaphores_.back().get();
  } catch (const std::bad_alloc&) {
    return nullptr;
  }
}

void PosixMultiTask::DeleteSemaphore(ISemaphore* semaphore) {
  const std::lock_guard<std::mutex> lock(mutex_);
  const auto found = std::find_if(semaphores_.begin(), semaphores_.end(),
                                  [&](const auto& known) { return known.get() == semaphore; });
  if (found != semaphores_.end()) {
    semaphores_.erase(found);
  }
}

void PosixMultiTask::Sleep(int milliseconds) {
  if (milliseconds <= 0) {
    YieldOnceATick();
  } else {
    Deadline::After(milliseconds).Sleep();
  }
}

ITask* PosixMultiTask::CreateTask(ITaskRunner* runner, int /*taskClass*/) {
  if (runner == nullptr) {
    return nullptr;
  }
  try {
    auto task = std::make_shared<PosixTask>(runner);
    const std::lock_guard<std::mutex> lock(mutex_);
    tasks_.push_back(std::move(task));
    return tasks_.back().get();
  } catch (const std::bad_alloc&) {
    return nullptr;
  }
}

bool PosixMultiTask::EndTasks(int timeoutMs) {
  const Deadline deadline = Deadline::After(timeoutMs);
  std::vector<std::shared_ptr<PosixTask>> tasks;
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    tasks = tasks_;
  }
  for (const std::shared_ptr<PosixTask>& task : tasks) {
    task->RequestEnd();
  }
  for (const std::shared_ptr<PosixTask>& task : tasks) {
    (void)StopTask(task.get(), deadline.RemainingMs());
  }
  return TaskCount() == 0;
}

std::size_t PosixMultiTask::TaskCount() const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return tasks_.size();
}

std::size_t PosixMultiTask::SemaphoreCount() const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return semaphores_.size();
}
