// SPDX-License-Identifier: Apache-2.0
#include "host/runtime/PosixTask.h"

#include <pthread.h>

#include <new>
#include <system_error>

#include "host/base/Deadline.h"
#include "interfaces/CompareInterface.h"
#include "interfaces/ITaskRunner.h"

namespace {

constexpr const char* kThreadName = "loka-task";

// The state of the task whose thread this is; only compared, never followed.
thread_local const void* currentState = nullptr;

}  // namespace

PosixTask::PosixTask(ITaskRunner* runner) : runner_(runner), state_(std::make_shared<State>()) {}

PosixTask::~PosixTask() {
  if (!thread_.joinable()) {
    return;
  }
  bool isEnded = false;
  {
    const std::lock_guard<std::mutex> lock(state_->mutex);
    isEnded = state_->isEnded;
  }
  // Once the end is announced only the thread's own last steps are left to wait for.
  isEnded ? thread_.join() : thread_.detach();
}

void* PosixTask::ConvertTo(const char* name) {
  const bool isOurs = CompareInterface(name, "PosixTask") || CompareInterface(name, "ITask");
  return isOurs ? this : nullptr;
}

int PosixTask::IsToEnd() { return state_->isToEnd.load() ? 1 : 0; }

int PosixTask::Start() {
  const std::lock_guard<std::mutex> lock(state_->mutex);
  if (state_->isStarted || state_->isEnded) {
    return 0;
  }
  try {
    thread_ = std::thread([state = state_, runner = runner_] {
      currentState = state.get();
      (void)pthread_setname_np(pthread_self(), kThreadName);
      runner->Task();
      const std::lock_guard<std::mutex> endLock(state->mutex);
      state->isEnded = true;
      state->changed.notify_all();
    });
  } catch (const std::system_error&) {
    return 0;
  } catch (const std::bad_alloc&) {
    return 0;
  }
  state_->isStarted = true;
  return 1;
}

void PosixTask::RequestEnd() {
  const std::lock_guard<std::mutex> lock(state_->mutex);
  state_->isToEnd.store(true);
  if (!state_->isStarted) {
    state_->isEnded = true;
  }
}

bool PosixTask::WaitForEnd(const Deadline& deadline) {
  std::unique_lock<std::mutex> lock(state_->mutex);
  return state_->changed.wait_for(lock, deadline.Remaining(), [this] { return state_->isEnded; });
}

bool PosixTask::IsCurrentThread() const { return currentState == state_.get(); }
