// SPDX-License-Identifier: Apache-2.0
#include "tests/support/ScriptedSemaphore.h"

#include <algorithm>
#include <utility>
#include <vector>

#include "tests/support/HostCall.h"
#include "tests/support/ReceiveTaskMark.h"

namespace {
thread_local std::vector<std::pair<const ScriptedSemaphore*, ScriptedSemaphore::Kind>> heldHere;
}  // namespace

ScriptedSemaphore::ScriptedSemaphore(CallLog& log, std::string name, Kind kind)
    : log_(log), name_(std::move(name)), kind_(kind) {}

void* ScriptedSemaphore::ConvertTo(const char* /*name*/) { return nullptr; }

void ScriptedSemaphore::RunHook() {
  std::function<void()> hook;
  {
    const std::lock_guard<std::mutex> guard(mutex_);
    if (hookCountdown_ == 0 || --hookCountdown_ != 0) return;
    hook.swap(hook_);
  }
  const ReceiveTaskMark anotherThread(false);
  hook();
}

void ScriptedSemaphore::CheckOrder() {
  for (const auto& other : heldHere) {
    if (ReceiveTaskMark::IsSet()) {
      log_.AddViolation("the receive task takes " + name_ + " while it holds another semaphore");
    }
    if (kind_ == Kind::kQueue && other.second == Kind::kPort) {
      log_.AddViolation(name_ + " taken behind a port semaphore");
    }
  }
}

int ScriptedSemaphore::Lock() {
  const HostCall inside;
  RunHook();
  CheckOrder();
  std::unique_lock<std::mutex> lock(mutex_);
  if (deleted_) log_.AddViolation(name_ + ".Lock after it was deleted");
  if (held_ && holder_ == std::this_thread::get_id()) {
    log_.AddViolation(name_ + ".Lock by the thread that holds it");
    return 0;
  }
  const unsigned long long ticket = nextTicket_++;
  changed_.wait(lock, [&] { return ticket == servedTicket_; });
  held_ = true;
  holder_ = std::this_thread::get_id();
  heldHere.emplace_back(this, kind_);
  log_.Add(name_ + ".Lock");
  return 1;
}

int ScriptedSemaphore::Unlock() {
  const HostCall inside;
  const std::lock_guard<std::mutex> guard(mutex_);
  if (!held_ || holder_ != std::this_thread::get_id()) {
    log_.AddViolation(name_ + ".Unlock by a thread that does not hold it");
    return 0;
  }
  log_.Add(name_ + ".Unlock");
  held_ = false;
  heldHere.erase(std::find_if(heldHere.begin(), heldHere.end(),
                              [this](const auto& entry) { return entry.first == this; }));
  ++servedTicket_;
  changed_.notify_all();
  return 1;
}

bool ScriptedSemaphore::IsHeld() const {
  const std::lock_guard<std::mutex> guard(mutex_);
  return held_;
}

void ScriptedSemaphore::BeforeNthLock(int nth, std::function<void()> action) {
  const std::lock_guard<std::mutex> guard(mutex_);
  hookCountdown_ = nth;
  hook_ = std::move(action);
}

void ScriptedSemaphore::MarkDeleted() {
  const std::lock_guard<std::mutex> guard(mutex_);
  if (deleted_) log_.AddViolation(name_ + " deleted twice");
  if (held_) log_.AddViolation(name_ + " deleted while it is held");
  deleted_ = true;
}

bool ScriptedSemaphore::IsDeleted() const {
  const std::lock_guard<std::mutex> guard(mutex_);
  return deleted_;
}
