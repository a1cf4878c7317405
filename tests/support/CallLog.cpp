// SPDX-License-Identifier: Apache-2.0
#include "tests/support/CallLog.h"

#include <algorithm>

void CallLog::Add(const std::string& line) {
  const std::lock_guard<std::mutex> guard(mutex_);
  if (recording_) lines_.push_back(line);
}

void CallLog::AddViolation(const std::string& text) {
  const std::lock_guard<std::mutex> guard(mutex_);
  violations_ += text + "\n";
}

void CallLog::SetRecording(bool on) {
  const std::lock_guard<std::mutex> guard(mutex_);
  recording_ = on;
}

std::string CallLog::Text() const {
  const std::lock_guard<std::mutex> guard(mutex_);
  std::string text;
  for (const std::string& line : lines_) text += line + "\n";
  return text;
}

std::string CallLog::Take() {
  const std::lock_guard<std::mutex> guard(mutex_);
  std::string text;
  for (const std::string& line : lines_) text += line + "\n";
  lines_.clear();
  return text;
}

int CallLog::Count(const std::string& line) const {
  const std::lock_guard<std::mutex> guard(mutex_);
  return static_cast<int>(std::count(lines_.begin(), lines_.end(), line));
}

std::string CallLog::Violations() const {
  const std::lock_guard<std::mutex> guard(mutex_);
  return violations_;
}

void CallLog::ClearViolations() {
  const std::lock_guard<std::mutex> guard(mutex_);
  violations_.clear();
}
