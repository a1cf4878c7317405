// SPDX-License-Identifier: Apache-2.0
#include "tests/support/FaultPlan.h"

void FaultPlan::FailNth(const std::string& operation, int nth) {
  const std::lock_guard<std::mutex> guard(mutex_);
  nth_[operation].insert(nth);
}

void FaultPlan::FailAlways(const std::string& operation) {
  const std::lock_guard<std::mutex> guard(mutex_);
  always_.insert(operation);
}

void FaultPlan::FailNthOfAll(int nth) {
  const std::lock_guard<std::mutex> guard(mutex_);
  nthOfAll_ = nth;
}

void FaultPlan::FailAllFrom(int nth) {
  const std::lock_guard<std::mutex> guard(mutex_);
  allFrom_ = nth;
}

void FaultPlan::Clear() {
  const std::lock_guard<std::mutex> guard(mutex_);
  nth_.clear();
  always_.clear();
  counts_.clear();
  nthOfAll_ = 0;
  allFrom_ = 0;
  failed_ = 0;
  failedOperations_.clear();
  total_ = 0;
}

bool FaultPlan::IsToFail(const std::string& operation) {
  const std::lock_guard<std::mutex> guard(mutex_);
  const int nth = ++counts_[operation];
  ++total_;
  const auto found = nth_.find(operation);
  const bool isToFail = total_ == nthOfAll_ || (allFrom_ != 0 && total_ >= allFrom_) ||
                        always_.count(operation) != 0 ||
                        (found != nth_.end() && found->second.count(nth) != 0);
  if (isToFail) {
    ++failed_;
    failedOperations_.insert(operation);
  }
  return isToFail;
}

int FaultPlan::CallCount() const {
  const std::lock_guard<std::mutex> guard(mutex_);
  return total_;
}

int FaultPlan::FailedCount() const {
  const std::lock_guard<std::mutex> guard(mutex_);
  return failed_;
}

std::set<std::string> FaultPlan::FailedOperations() const {
  const std::lock_guard<std::mutex> guard(mutex_);
  return failedOperations_;
}
