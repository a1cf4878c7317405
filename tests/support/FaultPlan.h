// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <map>
#include <mutex>
#include <set>
#include <string>

// Says which host calls are to fail: the n-th call of one operation, all calls of it, the n-th
// call of any operation that can fail, or all calls from the n-th on. Calls count from 1. Any
// thread.
class FaultPlan {
 public:
  void FailNth(const std::string& operation, int nth);
  void FailAlways(const std::string& operation);
  void FailNthOfAll(int nth);
  void FailAllFrom(int nth);
  void Clear();

  // Called by the scripted objects once a call; true when this call is to fail.
  bool IsToFail(const std::string& operation);

  // Number of calls that could have failed, and that have failed, since the last Clear.
  int CallCount() const;
  int FailedCount() const;

  // The operations of which a call has failed since the last Clear.
  std::set<std::string> FailedOperations() const;

 private:
  mutable std::mutex mutex_;
  std::map<std::string, std::set<int>> nth_;
  std::set<std::string> always_;
  std::map<std::string, int> counts_;
  int nthOfAll_ = 0;
  int allFrom_ = 0;
  int failed_ = 0;
  std::set<std::string> failedOperations_;
  int total_ = 0;
};
