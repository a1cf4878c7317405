// SPDX-License-Identifier: Apache-2.0
#include "tests/support/ScriptedLine.h"

void ScriptedLine::Feed(const std::string& bytes) {
  const std::lock_guard<std::mutex> guard(mutex_);
  for (const char c : bytes) events_.push_back({static_cast<unsigned char>(c), 0});
  exhausted_ = false;
  changed_.notify_all();
}

void ScriptedLine::Silence(long long milliseconds) {
  const std::lock_guard<std::mutex> guard(mutex_);
  events_.push_back({-1, milliseconds});
  exhausted_ = false;
  changed_.notify_all();
}

bool ScriptedLine::Receive(unsigned char* byte, int timeoutMs) {
  std::unique_lock<std::mutex> lock(mutex_);
  if (events_.empty() && holdAtEnd_) {
    ++waiting_;
    changed_.notify_all();
    changed_.wait(lock, [this] { return !events_.empty() || !holdAtEnd_; });
    --waiting_;
  }
  long long leftMs = timeoutMs > 0 ? timeoutMs : 0;
  while (!events_.empty()) {
    Event& next = events_.front();
    if (next.byte >= 0) {
      *byte = static_cast<unsigned char>(next.byte);
      events_.pop_front();
      return true;
    }
    if (next.silenceMs > leftMs) {
      next.silenceMs -= leftMs;
      nowMs_ += leftMs;
      return false;
    }
    leftMs -= next.silenceMs;
    nowMs_ += next.silenceMs;
    events_.pop_front();
    if (leftMs <= 0) return false;
  }
  nowMs_ += leftMs;
  exhausted_ = true;
  return false;
}

bool ScriptedLine::IsExhausted() const {
  const std::lock_guard<std::mutex> guard(mutex_);
  return exhausted_;
}

long long ScriptedLine::EventsLeft() const {
  const std::lock_guard<std::mutex> guard(mutex_);
  return static_cast<long long>(events_.size());
}

long long ScriptedLine::NowMs() const {
  const std::lock_guard<std::mutex> guard(mutex_);
  return nowMs_;
}

void ScriptedLine::HoldAtEnd() {
  const std::lock_guard<std::mutex> guard(mutex_);
  holdAtEnd_ = true;
}

void ScriptedLine::LetGo() {
  const std::lock_guard<std::mutex> guard(mutex_);
  holdAtEnd_ = false;
  changed_.notify_all();
}

void ScriptedLine::WaitUntilHeld() {
  std::unique_lock<std::mutex> lock(mutex_);
  changed_.wait(lock, [this] { return waiting_ > 0; });
}
