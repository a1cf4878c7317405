// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <condition_variable>
#include <functional>
#include <mutex>
#include <string>
#include <thread>

#include "interfaces/ISemaphore.h"
#include "tests/support/CallLog.h"

// A host semaphore that serves its callers in the order in which they came, records each lock and
// unlock and knows the rules: not recursive, freed by its holder, queue before port, and never two
// at a time on the receive task.
class ScriptedSemaphore final : public ISemaphore {
 public:
  enum class Kind { kQueue, kPort };

  ScriptedSemaphore(CallLog& log, std::string name, Kind kind);

  void* ConvertTo(const char* name) override;
  int Lock() override;
  int Unlock() override;

  const std::string& Name() const { return name_; }
  bool IsHeld() const;

  // Runs `action` right before the nth Lock from now (1 is the next one) takes the semaphore, on
  // the locking thread: what another thread might do at that moment, without another thread.
  void BeforeNthLock(int nth, std::function<void()> action);

  // Called by the host when the semaphore is handed back; later use is a violation.
  void MarkDeleted();
  bool IsDeleted() const;

 private:
  void RunHook();
  void CheckOrder();

  CallLog& log_;
  const std::string name_;
  const Kind kind_;
  mutable std::mutex mutex_;
  std::condition_variable changed_;
  unsigned long long nextTicket_ = 0;
  unsigned long long servedTicket_ = 0;
  std::thread::id holder_;
  bool held_ = false;
  bool deleted_ = false;
  int hookCountdown_ = 0;
  std::function<void()> hook_;
};
